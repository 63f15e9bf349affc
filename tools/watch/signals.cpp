#include "watch/signals.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <poll.h>
#include <sys/signalfd.h>
#include <system_error>
#include <unistd.h>

namespace CTL {

namespace {

constexpr std::chrono::hours kLongestWait{1};

sigset_t SetOf(const std::vector<int> &numbers) {
    sigset_t set{};
    (void)::sigemptyset(&set);
    for (const int number : numbers) {
        (void)::sigaddset(&set, number);
    }
    return set;
}

int MillisecondsUntil(Clock::time_point until) {
    const auto left =
        std::clamp<Clock::duration>(until - Clock::now(), Clock::duration::zero(), kLongestWait);
    return static_cast<int>(std::chrono::ceil<std::chrono::milliseconds>(left).count());
}

} // namespace

Signals::Signals(const std::vector<int> &numbers) {
    const sigset_t set = SetOf(numbers);
    fd_ = VANO::FILEINDEX::UniqueFd(::signalfd(-1, &set, SFD_NONBLOCK | SFD_CLOEXEC));
    if (!fd_ || ::sigprocmask(SIG_BLOCK, &set, &former_) != 0) {
        throw std::system_error(errno, std::generic_category(), "Cannot wait for signals");
    }
}

Signals::~Signals() {
    (void)::sigprocmask(SIG_SETMASK, &former_, nullptr);
}

int Signals::WaitUntil(Clock::time_point until, int input) const {
    std::array<pollfd, 2> waiting{pollfd{fd_.Get(), POLLIN, 0}, pollfd{input, POLLIN, 0}};
    int ready = 0;
    do {
        ready = ::poll(waiting.data(), waiting.size(), MillisecondsUntil(until));
    } while (ready < 0 && errno == EINTR);
    signalfd_siginfo signal{};
    return ::read(fd_.Get(), &signal, sizeof(signal)) == sizeof(signal)
               ? static_cast<int>(signal.ssi_signo)
               : 0;
}

} // namespace CTL
