// Stands in for a game, a compatibility runner or the companion service: appends how it was started (program,
// working folder, arguments) to <BV_LAUNCH_RECORD>/<own file name>.record in one write, so that a reader never
// sees half a record, then exits with BV_LAUNCH_EXIT (default 0).
#include <cstdlib>
#include <fcntl.h>
#include <string>
#include <unistd.h>

int main(int argc, char** argv)
{
    if (const char* folder = std::getenv("BV_LAUNCH_RECORD")) {
        const std::string self = argv[0];
        char cwd[4096] = {};
        std::string record = "program=" + self + "\ncwd=" + (getcwd(cwd, sizeof cwd) ? cwd : "") + "\n";
        for (int i = 1; i < argc; ++i)
            record += "arg=" + std::string(argv[i]) + "\n";
        record += "end\n";
        const std::string path = std::string(folder) + "/" + self.substr(self.rfind('/') + 1) + ".record";
        const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
        if (file < 0 || write(file, record.data(), record.size()) != static_cast<ssize_t>(record.size()))
            return 99;
        close(file);
    }
    const char* exitCode = std::getenv("BV_LAUNCH_EXIT");
    return exitCode ? std::atoi(exitCode) : 0;
}
