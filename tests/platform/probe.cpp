// What the program tests run: it exits as told, or writes down how it was started.
//
//     platform_probe exit STATUS
//     platform_probe abort
//     platform_probe report FILE [ARGUMENT ...]

#include <cstdio>
#include <cstdlib>
#include <dirent.h>
#include <fstream>
#include <sstream>
#include <string>
#include <unistd.h>

namespace {

std::string TargetOf(const std::string &link) {
    char target[4096];
    const ssize_t length = ::readlink(link.c_str(), target, sizeof target);
    return length < 0 ? "closed" : std::string(target, static_cast<std::size_t>(length));
}

void ReportDescriptors(std::ostream &out) {
    DIR *directory = ::opendir("/proc/self/fd");
    const std::string own = std::to_string(::dirfd(directory));
    while (const dirent *entry = ::readdir(directory)) {
        if (entry->d_name[0] != '.' && entry->d_name != own) {
            out << "fd " << entry->d_name << ' '
                << TargetOf(std::string("/proc/self/fd/") + entry->d_name) << '\n';
        }
    }
    ::closedir(directory);
}

void ReportSignals(std::ostream &out) {
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);) {
        if (line.rfind("SigBlk:", 0) == 0 || line.rfind("SigIgn:", 0) == 0) {
            out << line.substr(0, 7) << line.substr(line.find_first_not_of('\t', 7)) << '\n';
        }
    }
}

int Report(int argc, char **argv) {
    const std::string file = argv[2];
    const std::string unfinished = file + ".part";
    {
        // Written through memory, so that the report's own descriptor is not in it.
        std::string text;
        {
            std::ostringstream out;
            ReportDescriptors(out);
            ReportSignals(out);
            for (int i = 0; i < argc; ++i) {
                out << "arg " << argv[i] << '\n';
            }
            text = out.str();
        }
        std::ofstream(unfinished) << text;
    }
    return std::rename(unfinished.c_str(), file.c_str()) == 0 ? 0 : 1;
}

} // namespace

int main(int argc, char **argv) {
    const std::string mode = argc > 1 ? argv[1] : "";
    if (mode == "exit" && argc > 2) {
        return std::atoi(argv[2]);
    }
    if (mode == "abort") {
        std::abort();
    }
    if (mode == "report" && argc > 2) {
        return Report(argc, argv);
    }
    return 99;
}
