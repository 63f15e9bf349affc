#include "base/unique_fd.h"

#include <cerrno>

namespace VANO::FILEINDEX {

UniqueFd::~UniqueFd() {
    if (fd_ < 0) {
        return;
    }
    const int saved = errno;
    ::close(fd_);
    errno = saved;
}

} // namespace VANO::FILEINDEX
