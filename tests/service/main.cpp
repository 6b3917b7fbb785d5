#include "TestSuite.h"

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
