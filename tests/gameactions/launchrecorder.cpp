// Stands in for a game, a compatibility runner or the companion service: appends one record of how it was
// started (program, working folder, arguments) to <BV_LAUNCH_RECORD>/<its own file name>.record, in a single
// write so that a reader never sees half a record, then exits with BV_LAUNCH_EXIT (default 0).
#include <cstdlib>
#include <fcntl.h>
#include <string>
#include <unistd.h>

int main(int argc, char** argv)
{
    const char* folder = std::getenv("BV_LAUNCH_RECORD");
    if (folder && *folder) {
        std::string self = argv[0];
        const std::string::size_type slash = self.rfind('/');
        if (slash != std::string::npos)
            self = self.substr(slash + 1);
        char cwd[4096] = {};
        std::string record = "program=" + std::string(argv[0]) + "\ncwd=" + (getcwd(cwd, sizeof cwd) ? cwd : "") + "\n";
        for (int i = 1; i < argc; ++i)
            record += "arg=" + std::string(argv[i]) + "\n";
        record += "end\n";
        const std::string path = std::string(folder) + "/" + self + ".record";
        const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
        if (file >= 0) {
            const ssize_t written = write(file, record.data(), record.size());
            close(file);
            if (written != static_cast<ssize_t>(record.size()))
                return 99;
        }
    }
    const char* exitCode = std::getenv("BV_LAUNCH_EXIT");
    return exitCode ? std::atoi(exitCode) : 0;
}
