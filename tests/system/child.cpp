#include "child.h"

#include <csignal>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <spawn.h>
#include <sstream>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "support/files.h"

namespace VANO::TESTS {

namespace {

constexpr std::chrono::seconds kPatience{10};

int StatusOf(int raw) {
    return WIFEXITED(raw) ? WEXITSTATUS(raw) : 128 + WTERMSIG(raw);
}

} // namespace

Child::Child(const std::vector<std::string> &command, const std::string &outFile,
             const std::string &errorFile) {
    std::vector<char *> arguments;
    for (const std::string &argument : command) {
        arguments.push_back(const_cast<char *>(argument.c_str()));
    }
    arguments.push_back(nullptr);
    constexpr int kFlags = O_WRONLY | O_CREAT | O_APPEND;
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    ::posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, outFile.c_str(), kFlags, 0644);
    ::posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, errorFile.c_str(), kFlags, 0644);
    const int failure =
        ::posix_spawn(&pid_, arguments[0], &actions, nullptr, arguments.data(), environ);
    ::posix_spawn_file_actions_destroy(&actions);
    if (failure != 0) {
        pid_ = -1;
        isWaitedFor_ = true;
        ADD_FAILURE() << "cannot start " << command[0] << ", error " << failure;
    }
}

Child::~Child() {
    if (!isWaitedFor_) {
        Signal(SIGKILL);
        (void)Wait();
    }
}

void Child::Signal(int number) const {
    if (!isWaitedFor_) {
        (void)::kill(pid_, number);
    }
}

bool Child::IsRunning() {
    int raw = 0;
    if (!isWaitedFor_ && ::waitpid(pid_, &raw, WNOHANG) == pid_) {
        isWaitedFor_ = true;
        status_ = StatusOf(raw);
    }
    return !isWaitedFor_;
}

int Child::Wait() {
    int raw = 0;
    if (!isWaitedFor_ && ::waitpid(pid_, &raw, 0) == pid_) {
        isWaitedFor_ = true;
        status_ = StatusOf(raw);
    }
    return status_;
}

Outcome RunToEnd(const std::vector<std::string> &command) {
    const std::string out = "/tmp/run.out";
    const std::string error = "/tmp/run.err";
    (void)::unlink(out.c_str());
    (void)::unlink(error.c_str());
    Child child(command, out, error);
    const int status = child.Wait();
    return {status, ReadText(out), ReadText(error)};
}

bool Eventually(const std::function<bool()> &isSo) {
    const auto end = std::chrono::steady_clock::now() + kPatience;
    while (!isSo()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return true;
}

std::vector<std::string> LinesOf(const std::string &text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

} // namespace VANO::TESTS
