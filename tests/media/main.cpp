#include "TestSuite.h"

#include "media/WebEngineStartup.h"

int main(int argc, char** argv)
{
    Brimvault::PrepareWebEngine();
    return RunRegisteredTests(argc, argv);
}
