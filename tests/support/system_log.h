#ifndef FILEINDEX_TESTS_SYSTEM_LOG_H
#define FILEINDEX_TESTS_SYSTEM_LOG_H

// The system log's side of /dev/log: a real datagram socket, read by a thread of its own so that no
// writer ever waits. Lines reach the event trace as "log: <text>".
//
//     EXPECT_FALSE(config.LoadJson());
//     ExpectLog({"config:22 Failed to load json from /tmp/x"});   // of the fixture
//
// Because syslog(3) hands a line over before it returns, a look right after a call sees them all.

#include <string>
#include <vector>

namespace VANO::TESTS {

struct LogLine {
    int priority; // LOG_ERR and so on, without the facility
    std::string text;
};

class SystemLog {
  public:
    // Opens the socket on first use; it then lives as long as the process.
    static SystemLog &Get();

    // Takes the lines that were written since the last call, without time and program name.
    std::vector<LogLine> Lines();

    // A gtest failure at the caller's place unless the lines that were written since the last look
    // are exactly these, all at error priority. A line number of "*" ("utils:* text") stands for
    // any number. The lines are consumed either way.
    void Expect(const std::vector<std::string> &texts, const char *file = __builtin_FILE(),
                int line = __builtin_LINE());

  private:
    SystemLog();
};

// Whether a line is the expected one, "*" as line number standing for any number.
bool IsLogText(const std::string &text, const std::string &expected);

} // namespace VANO::TESTS

#endif
