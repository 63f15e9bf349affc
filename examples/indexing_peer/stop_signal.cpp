#include "stop_signal.h"

#include <csignal>
#include <poll.h>
#include <sys/signalfd.h>

namespace peer {

StopSignal::StopSignal() {
    sigset_t signals;
    (void)sigemptyset(&signals);
    (void)sigaddset(&signals, SIGTERM);
    (void)sigaddset(&signals, SIGINT);
    fd_ = OwnedFd(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
    if (fd_) { // without it they keep ending the process, which loses nothing either
        (void)::sigprocmask(SIG_BLOCK, &signals, nullptr);
    }
}

bool StopSignal::HasCome() const {
    pollfd waiting{fd_.Get(), POLLIN, 0};
    return ::poll(&waiting, 1, 0) > 0;
}

} // namespace peer
