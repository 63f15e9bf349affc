#ifndef FILEINDEXCTL_TERMINAL_MESSAGES_H
#define FILEINDEXCTL_TERMINAL_MESSAGES_H

#include <string>
#include <vector>

// What the tool says and how it ends. Everything here goes to standard error.

namespace CTL {

// What the tool tells its caller.
enum ExitCode : int {
    kDone = 0,
    kFailed = 1,   // it could not be done
    kUsage = 2,    // a mistake in the call; nothing was done
    kNotFound = 3, // not indexed, or nothing of that name; nothing was done
    // As init scripts have it, for the commands that tell how the service is:
    kPaused = 3,  // paused, or not running
    kUnknown = 4, // that could not be told
};

// A message of the tool.
void Say(const std::string &message);

// A further line of it: what to do next.
void Advise(const std::string &advice);

// Says what could not be done ("Cannot add /photos"), why, from the last errors of the library and
// of the platform, and what to do about it.
ExitCode Fail(const std::string &what);

// Where the daemon did not hear of a change that was saved.
constexpr char kDaemonAdvice[] =
    "The daemon could not be told: is fileindexd running? Run fileindexctl doctor daemon.";

// Where the settings did change and only the service did not follow: says so.
ExitCode FailHalfWay(const std::string &what, const std::string &advice);

// Whether what the library has failed at came before it saved the settings. What fails later it
// does not name, except for a path that cannot be resolved, and that may be another folder's.
[[nodiscard]] bool IsUnsaved();

// Forgets the last errors of the library and of the platform: a question that was answered with no
// is no error that a later message should name.
void ForgetErrors();

// While this lives, a person at a terminal sees what is being waited for.
class Working {
  public:
    explicit Working(const std::string &what);
    ~Working();
    Working(const Working &) = delete;
    Working &operator=(const Working &) = delete;

  private:
    bool isShown_;
};

// What `act` returns, with `what` shown meanwhile ("Telling the indexing service").
template <typename Act>
[[nodiscard]] auto While(const std::string &what, Act act) {
    const Working working(what);
    return act();
}

// Paths for a message: "/a, /b and 3 more".
[[nodiscard]] std::string Named(const std::vector<std::string> &paths);

// "/a is not an indexed folder", or "/a, /b are not indexed folders".
[[nodiscard]] std::string NamedNotSet(const std::vector<std::string> &paths);

} // namespace CTL

#endif
