#include "doctor/finding.h"

#include <array>
#include <cerrno>
#include <system_error>
#include <unistd.h>
#include <utility>

#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

constexpr char kPlainCharacters[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789"
                                    "_./:@%+=,-";

Finding Make(Severity severity, std::string code, std::string subject, std::string what) {
    Finding finding;
    finding.severity = severity;
    finding.code = std::move(code);
    finding.subject = std::move(subject);
    finding.what = std::move(what);
    return finding;
}

bool IsForRootOnly(int error) {
    return ::geteuid() != 0 && (error == EACCES || error == EPERM);
}

} // namespace

Finding &&Finding::Because(std::string text) && {
    why = std::move(text);
    return std::move(*this);
}

Finding &&Finding::Fix(std::string text, std::string line) && {
    fix = std::move(text);
    command = std::move(line);
    return std::move(*this);
}

Finding &&Finding::With(const char *key, const Json::Value &value) && {
    details[key] = value;
    return std::move(*this);
}

Finding Ok(std::string code, std::string subject, std::string what) {
    return Make(Severity::kOk, std::move(code), std::move(subject), std::move(what));
}

Finding Unknown(std::string code, std::string subject, std::string what) {
    return Make(Severity::kUnknown, std::move(code), std::move(subject), std::move(what));
}

Finding Warning(std::string code, std::string subject, std::string what) {
    return Make(Severity::kWarning, std::move(code), std::move(subject), std::move(what));
}

Finding Error(std::string code, std::string subject, std::string what) {
    return Make(Severity::kError, std::move(code), std::move(subject), std::move(what));
}

Finding Unreadable(std::string code, const std::string &path, int error) {
    if (IsForRootOnly(error)) {
        return Unknown("needs-root", path, Shown(path) + " can be checked by root only")
            .Fix("Run it as root.", "sudo fileindexctl doctor");
    }
    // What reads files refuses other kinds so.
    const std::string what =
        error == EINVAL ? " is not a regular file" : " cannot be read: " + Reason(error);
    return Error(std::move(code), path, Shown(path) + what)
        .Fix("Check its type, owner and permissions.", "ls -ld " + Quoted(path));
}

std::string Quoted(const std::string &word) {
    if (!word.empty() && word.find_first_not_of(kPlainCharacters) == std::string::npos) {
        return word;
    }
    const std::string shown = Shown(word);
    if (shown == word && word.find('\'') == std::string::npos) {
        return "'" + word + "'";
    }
    // The shell reads the escapes of Shown() in this kind of quotes.
    std::string quoted = "$'";
    for (const char c : shown) {
        quoted += c == '\'' ? "\\'" : std::string(1, c);
    }
    return quoted + "'";
}

std::string ShowCommand(const std::string &folder) {
    return "fileindexctl show " + Quoted(folder);
}

std::string Size(unsigned long long bytes) {
    constexpr std::array<const char *, 6> kUnits = {"bytes", "KiB", "MiB", "GiB", "TiB", "PiB"};
    std::size_t unit = 0;
    while (bytes >= 1024 && unit + 1 < kUnits.size()) {
        bytes /= 1024;
        ++unit;
    }
    return std::to_string(bytes) + " " + kUnits.at(unit);
}

std::string Reason(int error) {
    return std::generic_category().message(error);
}

} // namespace CTL::DOCTOR
