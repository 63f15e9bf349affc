#include "messages.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fileindex/error_handler.h>
#include <iostream>
#include <string_view>
#include <unistd.h>
#include <vano_platform.h>

#include "output.h"
#include "text.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr std::size_t kMostNamed = 3;

struct Explanation {
    const char *why;
    const char *advice;
};

Explanation ExplanationOf(fileindex::_tag_fileindex_err_ code) {
    switch (code) {
    case fileindex::FILEINDEX_ERR_BAD_PARAM:
        return {"a path or a value of the request cannot be used", "Check how the path is spelt."};
    case fileindex::FILEINDEX_ERR_PATH:
        return {"no share has that name", "Paths begin with /SHARE; check how the share is spelt."};
    case fileindex::FILEINDEX_ERR_NO_SUCH_FOLDER:
        return {"no such folder is set", "fileindexctl list shows those that are."};
    case fileindex::FILEINDEX_ERR_FOLDER_LIMIT:
        return {"1000 folders are set, which is the most", "Remove one first."};
    case fileindex::FILEINDEX_ERR_LOAD:
        return {"a settings file cannot be read or is no JSON",
                "Look at the files in /usr/vano/etc/fileindex."};
    case fileindex::FILEINDEX_ERR_SAVE:
        return {"a settings file cannot be written",
                "Check room and permissions of /usr/vano/etc/fileindex."};
    case fileindex::FILEINDEX_ERR_MALFORMED:
        return {"a settings file does not hold what it should",
                "Look at the files in /usr/vano/etc/fileindex."};
    case fileindex::FILEINDEX_ERR_LOCK:
        return {"the settings are locked", "Another program may be changing them: try again."};
    case fileindex::FILEINDEX_ERR_NONE:
    case fileindex::FILEINDEX_ERR_RESERVED:
        break;
    }
    return {"a part of the indexing service does not answer or cannot be changed",
            "The system log says which."};
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

bool MayNeedRoot(fileindex::_tag_fileindex_err_ code) {
    return ::geteuid() != 0 &&
           (code == fileindex::FILEINDEX_ERR_LOAD || code == fileindex::FILEINDEX_ERR_SAVE ||
            code == fileindex::FILEINDEX_ERR_LOCK);
}

// A person gets lines that fit, a program one line.
std::string ForReader(const std::string &message) {
    return ::isatty(STDERR_FILENO) == 1 ? Wrapped(message, TerminalColumns(STDERR_FILENO), 2)
                                        : message;
}

bool CanErase() {
    const char *terminal = std::getenv("TERM");
    return terminal != nullptr && std::string_view(terminal) != "dumb";
}

} // namespace

void Say(const std::string &message) {
    std::cerr << ForReader("fileindexctl: " + message) << '\n';
}

void Advise(const std::string &advice) {
    std::cerr << ForReader("  " + advice) << '\n';
}

ExitCode Fail(const std::string &what) {
    const auto code = fileindex::ErrorHandler::GetError();
    const Explanation explanation = ExplanationOf(code);
    Say(what + ": " + explanation.why + PlatformError() + ".");
    Advise(MayNeedRoot(code) ? "This needs root: try again with sudo." : explanation.advice);
    return kFailed;
}

ExitCode FailHalfWay(const std::string &what, const std::string &advice) {
    Say(what + ", but not every part of the indexing service followed" + PlatformError() + ".");
    Advise(advice);
    return kFailed;
}

bool HasNoError() {
    return fileindex::ErrorHandler::GetError() == fileindex::FILEINDEX_ERR_NONE;
}

Working::Working(const std::string &what) : isShown_(::isatty(STDERR_FILENO) == 1 && CanErase()) {
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
    return Named(paths) + (paths.size() == 1 ? " is not set" : " are not set");
}

} // namespace CTL
