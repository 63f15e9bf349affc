#include <atomic>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <memory>
#include <new>
#include <string>
#include <sys/mman.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>
#include <vector>

#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/files.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr char kProbe[] = PROBE_PATH;
constexpr char kReport[] = "/tmp/report";

int Execute(const std::vector<const char *> &arguments, int wait = 1) {
    std::vector<const char *> argv{kProbe};
    argv.insert(argv.end(), arguments.begin(), arguments.end());
    argv.push_back(nullptr);
    return VLIBCExecv(kProbe, argv.data(), wait);
}

// A signal's disposition, changed for as long as the object lives.
class Disposition {
  public:
    Disposition(int signal, void (*handler)(int), int flags = 0) : signal_(signal) {
        struct sigaction action {};
        action.sa_handler = handler;
        action.sa_flags = flags;
        ::sigaction(signal, &action, &old_);
    }
    Disposition(const Disposition &) = delete;
    Disposition &operator=(const Disposition &) = delete;
    ~Disposition() { ::sigaction(signal_, &old_, nullptr); }

  private:
    int signal_;
    struct sigaction old_ {};
};

class ProgramTest : public ::testing::Test {
  protected:
    void TearDown() override { RemoveTree(kReport); }

    static std::string Report() { return ReadText(kReport); }

    // Without the two that the C library keeps for itself and has every program ignore.
    static unsigned long long IgnoredSignals() {
        const std::string report = Report();
        const std::size_t start = report.find("SigIgn:");
        constexpr unsigned long long kLibrarySignals = 3ULL << 31U;
        return std::stoull(report.substr(start + 7), nullptr, 16) & ~kLibrarySignals;
    }
};

TEST_F(ProgramTest, SucceedsOnlyForExitStatusZero) {
    EXPECT_EQ(0, Execute({"exit", "0"}));
    EXPECT_NE(0, Execute({"exit", "1"}));
    EXPECT_EQ(kErrProgramFailed, VLIBCErrGet());
    EXPECT_NE(0, Execute({"exit", "255"}));
}

TEST_F(ProgramTest, AKilledProgramFails) {
    EXPECT_NE(0, Execute({"abort"}));
    EXPECT_EQ(kErrProgramFailed, VLIBCErrGet());
}

TEST_F(ProgramTest, AMissingProgramFails) {
    const char *const argv[] = {"/tmp/none", nullptr};
    EXPECT_NE(0, VLIBCExecv("/tmp/none", argv, 1));
    EXPECT_EQ(kErrProgramStart, VLIBCErrGet());
    EXPECT_NE(0, VLIBCExecv("/tmp/none", argv, 0));
    EXPECT_EQ(kErrProgramStart, VLIBCErrGet());
}

TEST_F(ProgramTest, AFileThatIsNoProgramFails) {
    PutFile("/tmp/plain", "no program");
    const char *const argv[] = {"/tmp/plain", nullptr};
    EXPECT_NE(0, VLIBCExecv("/tmp/plain", argv, 1));
    EXPECT_EQ(kErrProgramStart, VLIBCErrGet());
}

TEST_F(ProgramTest, BadArgumentsFail) {
    const char *const argv[] = {kProbe, nullptr};
    const char *const empty[] = {nullptr};
    EXPECT_NE(0, VLIBCExecv(nullptr, argv, 1));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_NE(0, VLIBCExecv(kProbe, nullptr, 1));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_NE(0, VLIBCExecv(kProbe, empty, 1));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_NE(0, VLIBCExec(nullptr, nullptr, nullptr));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
}

TEST_F(ProgramTest, PassesArgumentsAsTheyAre) {
    ASSERT_EQ(0, Execute({"report", kReport, "a b", "$HOME", "*", ""}));
    EXPECT_THAT(Report(),
                HasSubstr(std::string("arg ") + kProbe +
                          "\narg report\narg /tmp/report\narg a b\narg $HOME\narg *\narg \n"));
}

TEST_F(ProgramTest, TheListFormRunsWithThePathAsItsName) {
    ASSERT_EQ(0, VLIBCExec(kProbe, "report", kReport, "last", nullptr, nullptr));
    EXPECT_THAT(Report(), HasSubstr(std::string("arg ") + kProbe +
                                    "\narg report\narg /tmp/report\narg last\n"));
}

TEST_F(ProgramTest, TheListFormReportsTheExitStatus) {
    EXPECT_EQ(0, VLIBCExec(kProbe, "exit", "0", nullptr, nullptr));
    EXPECT_NE(0, VLIBCExec(kProbe, "exit", "3", nullptr, nullptr));
    EXPECT_EQ(kErrProgramFailed, VLIBCErrGet());
}

TEST_F(ProgramTest, InheritsNoDescriptor) {
    const int open = ::open("/tmp", O_RDONLY | O_DIRECTORY); // not close-on-exec
    const int high = ::fcntl(open, F_DUPFD, 200);
    ASSERT_GE(high, 200);
    EXPECT_EQ(0, Execute({"report", kReport}));
    ::close(open);
    ::close(high);
    const std::string report = Report();
    EXPECT_THAT(report, HasSubstr("fd 0 /dev/null\n"));
    EXPECT_THAT(report, HasSubstr("fd 1 /dev/null\n"));
    EXPECT_THAT(report, HasSubstr("fd 2 /dev/null\n"));
    EXPECT_THAT(report, Not(HasSubstr("fd 3 ")));
    EXPECT_THAT(report, Not(HasSubstr(" /tmp\n")));
}

TEST_F(ProgramTest, WorksWithoutStandardDescriptors) {
    int saved[3] = {};
    for (int fd = 0; fd < 3; ++fd) {
        saved[fd] = ::fcntl(fd, F_DUPFD_CLOEXEC, 100);
        ::close(fd);
    }
    const int result = Execute({"report", kReport});
    for (int fd = 0; fd < 3; ++fd) {
        ::dup2(saved[fd], fd);
        ::close(saved[fd]);
    }
    ASSERT_EQ(0, result);
    EXPECT_THAT(Report(), HasSubstr("fd 2 /dev/null\n"));
}

TEST_F(ProgramTest, GetsDefaultSignals) {
    const Disposition pipe(SIGPIPE, SIG_IGN);
    const Disposition hangup(SIGHUP, SIG_IGN);
    sigset_t blocked;
    sigset_t old;
    ::sigemptyset(&blocked);
    ::sigaddset(&blocked, SIGTERM);
    ::pthread_sigmask(SIG_BLOCK, &blocked, &old);
    const int result = Execute({"report", kReport});
    sigset_t now;
    ::pthread_sigmask(SIG_SETMASK, &old, &now);
    ASSERT_EQ(0, result);
    EXPECT_EQ(1, ::sigismember(&now, SIGTERM)) << "the caller's own mask was changed";
    EXPECT_EQ(0, ::sigismember(&now, SIGINT)) << "the caller's own mask was changed";
    EXPECT_THAT(Report(), HasSubstr("SigBlk:0000000000000000\n"));
    EXPECT_EQ(0U, IgnoredSignals());
}

TEST_F(ProgramTest, LearnsTheStatusWhenTheCallerIgnoresItsChildren) {
    for (const int flags : {0, SA_NOCLDWAIT}) {
        const Disposition child(SIGCHLD, flags == 0 ? SIG_IGN : SIG_DFL, flags);
        EXPECT_EQ(0, Execute({"exit", "0"}));
        EXPECT_NE(0, Execute({"exit", "4"}));
        EXPECT_EQ(kErrProgramFailed, VLIBCErrGet());
    }
}

TEST_F(ProgramTest, LearnsTheStatusWhenTheCallerReapsEveryChild) {
    const Disposition child(
        SIGCHLD,
        [](int) {
            const int saved = errno;
            while (::waitpid(-1, nullptr, WNOHANG) > 0) {
            }
            errno = saved;
        },
        SA_RESTART);
    EXPECT_EQ(0, Execute({"exit", "0"}));
    EXPECT_NE(0, Execute({"exit", "4"}));
    EXPECT_EQ(kErrProgramFailed, VLIBCErrGet());
}

TEST_F(ProgramTest, SurvivesSignalsWhileItWaits) {
    const Disposition alarm(SIGALRM, [](int) {}); // without SA_RESTART
    ::ualarm(20000, 20000);
    EXPECT_EQ(0, VLIBCExec("/bin/sleep", "0.2", nullptr, nullptr));
    ::ualarm(0, 0);
}

pid_t testProcess = 0;
std::atomic<int> *handledElsewhere = nullptr; // shared with forked processes

TEST_F(ProgramTest, RunsNoneOfTheCallersHandlersElsewhere) {
    void *memory = ::mmap(nullptr, sizeof *handledElsewhere, PROT_READ | PROT_WRITE,
                          MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(MAP_FAILED, memory);
    handledElsewhere = new (memory) std::atomic<int>(0);
    testProcess = ::getpid();
    // A group of its own: the signal reaches this process and its children only.
    ASSERT_TRUE(::getpgrp() == testProcess || ::setpgid(0, 0) == 0);
    const Disposition user(SIGUSR1, [](int) { *handledElsewhere += ::getpid() != testProcess; });
    std::thread sender([] {
        std::this_thread::sleep_for(std::chrono::milliseconds(300));
        ::kill(0, SIGUSR1);
    });
    EXPECT_NE(0, VLIBCExec("/bin/sleep", "5", nullptr, nullptr)) << "the program was not killed";
    sender.join();
    EXPECT_EQ(0, *handledElsewhere);
    ::munmap(memory, sizeof *handledElsewhere);
}

TEST_F(ProgramTest, WaitsForTheProgram) {
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(0, VLIBCExec("/bin/sleep", "0.3", nullptr, nullptr));
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(300));
}

TEST_F(ProgramTest, DoesNotWaitWhenToldSo) {
    const auto start = std::chrono::steady_clock::now();
    const char *const argv[] = {"/bin/sleep", "5", nullptr};
    EXPECT_EQ(0, VLIBCExecv("/bin/sleep", argv, 0));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(3));
}

TEST_F(ProgramTest, LeavesNoChildBehind) {
    ASSERT_EQ(0, Execute({"exit", "0"}));
    ASSERT_EQ(0, Execute({"report", kReport}, 0));
    for (int i = 0; i < 500 && !Exists(kReport); ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    EXPECT_TRUE(Exists(kReport)) << "the program never ran";
    EXPECT_EQ(-1, ::waitpid(-1, nullptr, WNOHANG));
    EXPECT_EQ(ECHILD, errno);
}

TEST_F(ProgramTest, TheCallersLocksEndWithTheirDescriptors) {
    auto lock = std::make_unique<HoldLock>("/tmp/lock");
    std::thread runner([] { EXPECT_EQ(0, VLIBCExec("/bin/sleep", "1", nullptr, nullptr)); });
    std::this_thread::sleep_for(std::chrono::milliseconds(300)); // the program runs now
    lock.reset();
    EXPECT_FALSE(IsLocked("/tmp/lock"));
    runner.join();
}

TEST_F(ProgramTest, LeavesNoDescriptorOpen) {
    const auto before = NamesIn("/proc/self/fd").size();
    EXPECT_EQ(0, Execute({"exit", "0"}));
    EXPECT_NE(0, Execute({"exit", "1"}));
    EXPECT_NE(0, VLIBCExec("/tmp/none", nullptr, nullptr));
    EXPECT_EQ(before, NamesIn("/proc/self/fd").size());
}

TEST_F(ProgramTest, ThreadsRunProgramsAtOnce) {
    std::vector<int> results(8, -1);
    std::vector<std::thread> threads;
    for (std::size_t i = 0; i < results.size(); ++i) {
        threads.emplace_back([&results, i] { results[i] = Execute({"exit", i % 2 ? "1" : "0"}); });
    }
    for (auto &thread : threads) {
        thread.join();
    }
    for (std::size_t i = 0; i < results.size(); ++i) {
        EXPECT_EQ(i % 2 != 0, results[i] != 0) << i;
    }
}

} // namespace
