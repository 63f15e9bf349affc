#ifndef FILEINDEX_TESTS_FILES_H
#define FILEINDEX_TESTS_FILES_H

// Files as tests need them: short, and any failure fails the test on the spot.

#include <json/value.h>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <sys/types.h>
#include <vector>

namespace VANO::TESTS {

// Creates or rewrites a file in place, its directories included.
void PutFile(const std::string &path, std::string_view text);

// The whole content; a test failure and "" when it cannot be read. GetIfThere() says so instead.
std::string ReadText(const std::string &path);
std::optional<std::string> ReadIfThere(const std::string &path);

// The content as JSON; a test failure and null when it is none.
Json::Value ReadJson(const std::string &path);

// Parses a JSON text: Json(R"({"path":"/photos"})").
Json::Value Json(std::string_view text);

// The text of a value on one line, members sorted; written without the library's own writer.
std::string CompactText(const Json::Value &value);

void MakeDirs(const std::string &path);
void RemoveTree(const std::string &path);                       // nothing there is fine
bool Exists(const std::string &path);                           // by lstat
std::vector<std::string> NamesIn(const std::string &directory); // sorted

mode_t ModeOf(const std::string &path); // permission bits

// The descriptors that are open now, with what each stands for.
std::map<int, std::string> OpenDescriptors();

// Ends the process unless the places that tests change are private here.
void RequireSandbox();

// An exclusive (or shared) flock on a file from a descriptor of its own, as another process would
// hold it. The file is created when missing.
class HoldLock {
  public:
    explicit HoldLock(const std::string &path, bool exclusive = true);
    ~HoldLock();
    HoldLock(const HoldLock &) = delete;
    HoldLock &operator=(const HoldLock &) = delete;

  private:
    int fd_;
};

// Whether an exclusive flock on the file could be had now. A missing file is not locked.
bool IsLocked(const std::string &path);

} // namespace VANO::TESTS

#endif
