#include "terminal/messages.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <fileindex/error_handler.h>
#include <fileindex/folders.h>
#include <fileindex/status.h>
#include <iostream>
#include <sys/stat.h>
#include <system_error>
#include <unistd.h>
#include <vano_platform.h>

#include "base/unique_fd.h"
#include "terminal/terminal.h"
#include "terminal/text.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr std::size_t kMostNamed = 3;

struct Explanation {
    std::string why;
    const char *advice;
};

// Why nobody can have the lock, an errno: its file cannot be opened as the library opens it. 0 when
// somebody holds it.
int LockFileError() {
    for (const std::string &path :
         {fileindex::Folders().GetLockPath(), fileindex::Status().GetLockPath()}) {
        struct stat info {};
        if (::lstat(path.c_str(), &info) == 0 &&
            !fileindex::UniqueFd(
                ::open(path.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0644))) {
            return errno;
        }
    }
    return 0;
}

Explanation ExplanationOf(fileindex::_tag_fileindex_err_ code) {
    switch (code) {
    case fileindex::FILEINDEX_ERR_BAD_PARAM:
        return {"a path or value in the request is invalid", "Check the spelling of the path."};
    case fileindex::FILEINDEX_ERR_PATH:
        return {"no share has that name",
                "Paths begin with /SHARE; check the spelling of the share."};
    case fileindex::FILEINDEX_ERR_NO_SUCH_FOLDER:
        return {"the folder is not indexed", "fileindexctl list shows the indexed folders."};
    case fileindex::FILEINDEX_ERR_FOLDER_LIMIT:
        return {"the limit of 1000 folders is reached", "Remove one first."};
    case fileindex::FILEINDEX_ERR_LOAD:
        return {"a settings file cannot be read or is not valid JSON",
                "fileindexctl doctor settings shows where."};
    case fileindex::FILEINDEX_ERR_SAVE:
        return {"a settings file cannot be written",
                "Check free space and permissions of /usr/vano/etc/fileindex, or run "
                "fileindexctl doctor settings."};
    case fileindex::FILEINDEX_ERR_MALFORMED:
        return {"a settings file has unexpected content",
                "fileindexctl doctor settings shows where."};
    case fileindex::FILEINDEX_ERR_LOCK:
        if (const int error = LockFileError()) {
            return {"a lock file cannot be opened: " + std::generic_category().message(error),
                    "Run fileindexctl doctor locks."};
        }
        return {"the settings are locked", "Another program may be changing them: try again, or "
                                           "run fileindexctl doctor locks."};
    case fileindex::FILEINDEX_ERR_NONE:
    case fileindex::FILEINDEX_ERR_RESERVED:
        break;
    }
    return {"part of the indexing service does not respond or cannot be changed",
            "fileindexctl doctor and the system log say more."};
}

bool IsUnreadable(const std::string &path) {
    return ::access(path.c_str(), R_OK) != 0 && errno == EACCES;
}

std::string PlatformError() {
    const int code = VLIBCErrGet();
    if (code == 0) {
        return {};
    }
    const char *file = VLIBCErrorGetFile();
    char text[128];
    (void)std::snprintf(text, sizeof(text), " (platform error 0x%04X, %s:%d)",
                        static_cast<unsigned>(code), file == nullptr ? "?" : file,
                        VLIBCErrorGetLine());
    return text;
}

// Whether it failed for want of rights.
bool NeedsRoot(fileindex::_tag_fileindex_err_ code) {
    if (::geteuid() == 0) {
        return false;
    }
    switch (code) {
    case fileindex::FILEINDEX_ERR_LOAD:
        return IsUnreadable(fileindex::Folders().GetPath()) ||
               IsUnreadable(fileindex::Status().GetPath());
    case fileindex::FILEINDEX_ERR_LOCK:
        return LockFileError() != 0;
    default:
        return code == fileindex::FILEINDEX_ERR_SAVE;
    }
}

void PrintMessage(const std::string &message) {
    std::cerr << Wrapped(message, LineWidth(STDERR_FILENO), 2) << '\n';
}

} // namespace

void Say(const std::string &message) {
    PrintMessage("fileindexctl: " + message);
}

void Advise(const std::string &advice) {
    PrintMessage("  " + advice);
}

ExitCode Fail(const std::string &what) {
    const auto code = fileindex::ErrorHandler::GetError();
    const Explanation explanation = ExplanationOf(code);
    Say(what + ": " + explanation.why + PlatformError() + ".");
    Advise(NeedsRoot(code) ? "This needs root: try again with sudo." : explanation.advice);
    return kFailed;
}

ExitCode FailHalfWay(const std::string &what, const std::string &advice) {
    Say(what + ", but not every part of the indexing service was updated" + PlatformError() + ".");
    Advise(advice);
    return kFailed;
}

bool IsUnsaved() {
    const auto code = fileindex::ErrorHandler::GetError();
    return code != fileindex::FILEINDEX_ERR_NONE && code != fileindex::FILEINDEX_ERR_PATH;
}

void ForgetErrors() {
    fileindex::ErrorHandler::SetError(fileindex::FILEINDEX_ERR_NONE);
    VLIBCErrSetEx(0, "", 0);
}

Working::Working(const std::string &what)
    : isShown_(IsTerminal(STDERR_FILENO) && KnowsEscapeCodes()) {
    if (isShown_) {
        std::cerr << what << " ..." << std::flush;
    }
}

Working::~Working() {
    if (isShown_) {
        std::cerr << "\r\033[K" << std::flush;
    }
}

std::string Named(const std::vector<std::string> &paths) {
    std::string names;
    const std::size_t count = std::min(paths.size(), kMostNamed);
    for (std::size_t i = 0; i < count; ++i) {
        names += (i == 0 ? "" : ", ") + Shown(paths[i]);
    }
    return paths.size() > count ? names + " and " + std::to_string(paths.size() - count) + " more"
                                : names;
}

std::string NamedNotSet(const std::vector<std::string> &paths) {
    return Named(paths) +
           (paths.size() == 1 ? " is not an indexed folder" : " are not indexed folders");
}

} // namespace CTL
