// Stands in for a game, a compatibility runner or the companion service: appends how it was started (program,
// working folder, arguments; one line, separated by tabs) to <BV_LAUNCH_RECORD>/<own file name>.record in one
// write, so that a reader never sees half a record, then runs for BV_LAUNCH_SECONDS (default none) and exits
// with BV_LAUNCH_EXIT (default 0).
#include <cstdlib>
#include <fcntl.h>
#include <string>
#include <unistd.h>

int main(int argc, char** argv)
{
    if (const char* folder = std::getenv("BV_LAUNCH_RECORD")) {
        const std::string self = argv[0];
        char cwd[4096] = {};
        std::string record = self + "\t" + (getcwd(cwd, sizeof cwd) ? cwd : "");
        for (int i = 1; i < argc; ++i)
            record += "\t" + std::string(argv[i]);
        record += "\n";
        const std::string path = std::string(folder) + "/" + self.substr(self.rfind('/') + 1) + ".record";
        const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
        if (file < 0 || write(file, record.data(), record.size()) != static_cast<ssize_t>(record.size()))
            return 99;
        close(file);
    }
    if (const char* seconds = std::getenv("BV_LAUNCH_SECONDS"))
        sleep(unsigned(std::atoi(seconds)));
    const char* exitCode = std::getenv("BV_LAUNCH_EXIT");
    return exitCode ? std::atoi(exitCode) : 0;
}
