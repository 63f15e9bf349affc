#include "pty_child.h"

#include <array>
#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "system/child.h"

namespace VANO::TESTS {

namespace {

[[noreturn]] void Become(const std::vector<std::string> &command,
                         const std::vector<std::string> &settings) {
    for (const std::string &setting : settings) {
        (void)::putenv(const_cast<char *>(setting.c_str()));
    }
    std::vector<char *> arguments;
    for (const std::string &argument : command) {
        arguments.push_back(const_cast<char *>(argument.c_str()));
    }
    arguments.push_back(nullptr);
    (void)::execv(arguments[0], arguments.data());
    ::_exit(127);
}

} // namespace

PtyChild::PtyChild(const std::vector<std::string> &command,
                   const std::vector<std::string> &settings, unsigned short rows,
                   unsigned short columns) {
    const winsize size{rows, columns, 0, 0};
    pid_ = ::forkpty(&master_, nullptr, nullptr, &size);
    if (pid_ == 0) {
        Become(command, settings);
    }
    if (pid_ < 0) {
        isWaitedFor_ = true;
        ADD_FAILURE() << "no terminal to be had";
        return;
    }
    EXPECT_EQ(::fcntl(master_, F_SETFL, O_NONBLOCK), 0);
    EXPECT_EQ(::fcntl(master_, F_SETFD, FD_CLOEXEC), 0);
}

PtyChild::~PtyChild() {
    Signal(SIGKILL);
    if (!isWaitedFor_) {
        (void)::waitpid(pid_, nullptr, 0);
    }
    (void)::close(master_);
}

void PtyChild::Type(const std::string &keys) const {
    EXPECT_EQ(::write(master_, keys.data(), keys.size()), static_cast<ssize_t>(keys.size()));
}

void PtyChild::Resize(unsigned short rows, unsigned short columns) const {
    const winsize size{rows, columns, 0, 0};
    EXPECT_EQ(::ioctl(master_, TIOCSWINSZ, &size), 0);
}

void PtyChild::Signal(int number) const {
    if (!isWaitedFor_) {
        (void)::kill(pid_, number);
    }
}

const std::string &PtyChild::Output() {
    ReadWhatIsThere();
    return output_;
}

bool PtyChild::HasStopped() const {
    siginfo_t change{};
    return ::waitid(P_PID, static_cast<id_t>(pid_), &change, WSTOPPED | WNOHANG) == 0 &&
           change.si_pid == pid_;
}

int PtyChild::Wait() {
    int raw = 0;
    const bool hasEnded = Eventually([&] {
        ReadWhatIsThere(); // or it could not write the rest
        return isWaitedFor_ || ::waitpid(pid_, &raw, WNOHANG) == pid_;
    });
    if (!hasEnded) {
        return -1;
    }
    isWaitedFor_ = true;
    ReadWhatIsThere();
    return WIFEXITED(raw) ? WEXITSTATUS(raw) : 128 + WTERMSIG(raw);
}

termios PtyChild::Settings() const {
    termios settings{};
    EXPECT_EQ(::tcgetattr(master_, &settings), 0);
    return settings;
}

void PtyChild::ReadWhatIsThere() {
    std::array<char, 4096> chunk{};
    for (;;) {
        const ssize_t count = ::read(master_, chunk.data(), chunk.size());
        if (count <= 0) { // nothing now, or the program has gone
            return;
        }
        output_.append(chunk.data(), static_cast<std::size_t>(count));
    }
}

} // namespace VANO::TESTS
