#include "base/log.h"

#include <cerrno>
#include <clocale>
#include <fileindex/config.h>
#include <syslog.h>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

constexpr std::size_t kLongest = 128 * 1024;

class LogTest : public LibraryTest {};

TEST_F(LogTest, UnitAndLinePrecedeTheMessageAtErrorPriority) {
    LogError("utils", 389, "failed, path=%s, code=%d", "/photos", 7);
    const std::vector<LogLine> lines = SystemLog::Get().Lines();
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_ERR);
    EXPECT_EQ(lines[0].text, "utils:389 failed, path=/photos, code=7");
}

TEST_F(LogTest, TheLogLevelHoldsNothingBack) {
    for (const int level : {-1, 0, 2, 3, 6, 7, 8}) {
        LOG_LEVEL = level;
        LogError("utils", 1, "level=%d", level);
        ExpectLog({"utils:1 level=" + std::to_string(level)});
    }
}

TEST_F(LogTest, TheReasonIsTheErrorAtTheCall) {
    errno = ENOSPC;
    LogError("utils", 95, "queue=%s, reason=%s", "/q", ErrnoText().c_str());
    ExpectLog({"utils:95 queue=/q, reason=No space left on device"});
}

TEST_F(LogTest, ErrnoIsKept) {
    errno = EXDEV;
    LogError("utils", 1, "text");
    EXPECT_EQ(errno, EXDEV);
    ExpectLog({"utils:1 text"});
}

TEST_F(LogTest, PercentSignsInArgumentsAreText) {
    LogError("utils", 1, "path=%s", "/100%/%s%n%m");
    ExpectLog({"utils:1 path=/100%/%s%n%m"});
}

TEST_F(LogTest, BytesThatAreNoTextInTheLocaleAreKept) {
    ASSERT_NE(std::setlocale(LC_ALL, "C.UTF-8"), nullptr);
    LogError("utils", 1, "path=%s", "/\xff\xfe/\xc3");
    std::setlocale(LC_ALL, "C");
    ExpectLog({"utils:1 path=/\xff\xfe/\xc3"});
}

TEST_F(LogTest, NewlinesStayInTheOneMessage) {
    LogError("utils", 733, "a\nb (%s)\n", "c\nd");
    ExpectLog({"utils:733 a\nb (c\nd)\n"});
}

TEST_F(LogTest, ALongMessageIsCutAndNotLost) {
    const std::string text(kLongest + 100, 'x');
    LogError("utils", 1, "%s", text.c_str());
    ExpectLog({"utils:1 " + std::string(kLongest, 'x')});
    LogError("utils", 1, "%s", std::string(kLongest, 'y').c_str());
    ExpectLog({"utils:1 " + std::string(kLongest, 'y')});
}

} // namespace

} // namespace VANO::TESTS
