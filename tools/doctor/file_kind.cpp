#include "doctor/file_kind.h"

#include <cerrno>
#include <cstdio>
#include <ctime>
#include <filesystem>
#include <set>

#include "terminal/text.h"
#include "terminal/times.h"

namespace CTL::DOCTOR {

namespace {

constexpr long long kSecondsOfAWriter = 60; // a temporary file lives some milliseconds
constexpr std::size_t kRandomPart = sizeof(".XXXXXX") - 1;

std::string Octal(mode_t mode) {
    char text[8];
    (void)std::snprintf(text, sizeof(text), "%04o", static_cast<unsigned>(mode & 07777U));
    return text;
}

bool IsTemporary(const std::string &name, const std::string &prefix, const std::string &suffix) {
    if (name.size() < prefix.size() + suffix.size() + kRandomPart ||
        name.compare(0, prefix.size(), prefix) != 0) {
        return false;
    }
    const std::size_t end = name.size() - kRandomPart;
    return name[end] == '.' && name.find('.', end + 1) == std::string::npos &&
           name.compare(end - suffix.size(), suffix.size(), suffix) == 0;
}

} // namespace

FileLook::FileLook(const std::string &path)
    : error(::lstat(path.c_str(), &info) == 0 ? 0 : errno) {}

std::string KindOf(mode_t mode) {
    switch (mode & S_IFMT) {
    case S_IFREG:
        return "a regular file";
    case S_IFDIR:
        return "a directory";
    case S_IFLNK:
        return "a symbolic link";
    case S_IFIFO:
        return "a named pipe";
    case S_IFSOCK:
        return "a socket";
    default:
        return "a device";
    }
}

int DirectoryError(const std::string &path) {
    struct stat info {};
    if (::stat(path.c_str(), &info) != 0) {
        return errno;
    }
    return S_ISDIR(info.st_mode) ? 0 : ENOTDIR;
}

void FindOddOwner(Findings &findings, const std::string &path, const struct stat &info,
                  const char *goodMode) {
    if (info.st_uid != 0) {
        findings.push_back(
            Warning("odd-owner", path,
                    Shown(path) + " belongs to user " + std::to_string(info.st_uid))
                .Because("It should belong to root; its owner can change the service.")
                .Fix("Give it to root.", "chown root: " + Quoted(path)));
    }
    if ((info.st_mode & (S_IWGRP | S_IWOTH)) != 0) {
        findings.push_back(
            Warning("odd-mode", path,
                    Shown(path) + " can be changed by others: mode " + Octal(info.st_mode))
                .Fix("Let only root write to it.",
                     std::string("chmod ") + goodMode + " " + Quoted(path)));
    } else if ((info.st_mode & S_IROTH) == 0) {
        findings.push_back(
            Warning("odd-mode", path,
                    Shown(path) + " cannot be read by others: mode " + Octal(info.st_mode))
                .Because("Programs that do not run as root are told that nothing "
                         "is indexed.")
                .Fix("Let everyone read it.",
                     std::string("chmod ") + goodMode + " " + Quoted(path)));
    }
}

void FindStrayFiles(Findings &findings, const std::string &directory, const std::string &prefix,
                    const std::string &suffix) {
    for (const std::string &name : NamesIn(directory)) {
        std::string path = directory;
        path.append("/").append(name);
        const FileLook look(path);
        const long long age = std::time(nullptr) - look.info.st_mtime;
        if (!IsTemporary(name, prefix, suffix) || !look.IsRegular() || age < kSecondsOfAWriter) {
            continue;
        }
        findings.push_back(Warning("stray-file", path,
                                   Shown(path) + " was left behind " + DurationText(age) + " ago")
                               .Because("A program was killed while saving the file beside it.")
                               .Fix("Remove it.", "rm " + Quoted(path)));
    }
}

std::vector<std::string> NamesIn(const std::string &directory) {
    std::set<std::string> names;
    std::error_code error;
    for (std::filesystem::directory_iterator entry(directory, error), end; !error && entry != end;
         entry.increment(error)) {
        names.insert(entry->path().filename().string());
    }
    return {names.begin(), names.end()};
}

} // namespace CTL::DOCTOR
