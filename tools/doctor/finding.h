#ifndef FILEINDEXCTL_DOCTOR_FINDING_H
#define FILEINDEXCTL_DOCTOR_FINDING_H

#include <json/value.h>
#include <string>
#include <vector>

namespace CTL::DOCTOR {

// Worst last.
enum class Severity {
    kOk,
    kUnknown, // could not be looked at, mostly for want of root's rights
    kWarning, // works now, and may not for long
    kError,   // something does not work
};

// What one look has found. The texts are fit for a terminal; names in them have gone through
// Shown(). `subject` is the path or the name that it is about, byte for byte.
struct Finding {
    Severity severity;
    std::string code; // what scripts match on; never changes
    std::string subject;
    std::string what;
    std::string why;
    std::string fix;                                      // what to do about it
    std::string command;                                  // a command line towards that
    Json::Value details = Json::Value(Json::objectValue); // further facts for scripts

    Finding &&Because(std::string text) &&;
    // Whoever runs a command line without reading the text must not change what is indexed: where
    // only that would help, it looks closer, or there is none.
    Finding &&Fix(std::string text, std::string line = {}) &&;
    Finding &&With(const char *key, const Json::Value &value) &&;
};

using Findings = std::vector<Finding>;

[[nodiscard]] Finding Ok(std::string code, std::string subject, std::string what);
[[nodiscard]] Finding Unknown(std::string code, std::string subject, std::string what);
[[nodiscard]] Finding Warning(std::string code, std::string subject, std::string what);
[[nodiscard]] Finding Error(std::string code, std::string subject, std::string what);

// `path` cannot be looked at, for the reason `error`, an errno. Unknown where root could.
[[nodiscard]] Finding Unreadable(std::string code, const std::string &path, int error);

// A word of a command line, quoted where the shell needs it and readable on any terminal.
[[nodiscard]] std::string Quoted(const std::string &word);

// The command line that shows a folder's setting.
[[nodiscard]] std::string ShowCommand(const std::string &folder);

// "512 bytes", "17 MiB".
[[nodiscard]] std::string Size(unsigned long long bytes);

// The text of an errno.
[[nodiscard]] std::string Reason(int error);

} // namespace CTL::DOCTOR

#endif
