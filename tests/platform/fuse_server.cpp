#include "fuse_server.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <linux/fuse.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>
#include <vector>

namespace VANO::TESTS {

namespace {

constexpr char kDevice[] = "/tmp/fuse";
constexpr unsigned kDeviceMajor = 10;
constexpr unsigned kDeviceMinor = 229;

template <typename Body>
std::vector<char> Answer(const Body &body) {
    std::vector<char> bytes(sizeof body);
    std::memcpy(bytes.data(), &body, sizeof body);
    return bytes;
}

// The body of the answer; empty for a request that is refused.
std::vector<char> AnswerTo(const fuse_in_header &request) {
    switch (request.opcode) {
    case FUSE_INIT: {
        fuse_init_out body{};
        body.major = FUSE_KERNEL_VERSION;
        body.minor = FUSE_KERNEL_MINOR_VERSION;
        body.max_write = 4096;
        return Answer(body);
    }
    case FUSE_GETATTR: {
        fuse_attr_out body{};
        body.attr.ino = FUSE_ROOT_ID;
        body.attr.mode = S_IFDIR | 0755;
        body.attr.nlink = 2;
        return Answer(body);
    }
    case FUSE_STATFS:
        return Answer(fuse_statfs_out{});
    default:
        return {};
    }
}

} // namespace

FuseServer::FuseServer(const std::string &target) : target_(target) {
    (void)::mknod(kDevice, S_IFCHR | 0600, ::makedev(kDeviceMajor, kDeviceMinor));
    device_ = ::open(kDevice, O_RDWR | O_CLOEXEC);
    if (device_ < 0) {
        return;
    }
    const std::string options =
        "fd=" + std::to_string(device_) + ",rootmode=40000,user_id=0,group_id=0";
    if (::mount("test", target.c_str(), "fuse", 0, options.c_str()) == 0) {
        thread_ = std::thread([this] { Serve(); });
    }
}

FuseServer::~FuseServer() {
    if (IsMounted()) {
        ::umount2(target_.c_str(), MNT_FORCE); // ends the connection, and with it the thread
        thread_.join();
        ::umount2(target_.c_str(), MNT_DETACH);
    }
    if (device_ >= 0) {
        ::close(device_);
    }
}

void FuseServer::Serve() const {
    std::vector<char> buffer(256 * 1024);
    for (;;) {
        const ssize_t got = ::read(device_, buffer.data(), buffer.size());
        if (got < 0 && (errno == EINTR || errno == ENOENT)) {
            continue;
        }
        fuse_in_header request{};
        if (got < static_cast<ssize_t>(sizeof request)) {
            return;
        }
        std::memcpy(&request, buffer.data(), sizeof request);
        const std::vector<char> body = AnswerTo(request);
        fuse_out_header header{};
        header.len = static_cast<std::uint32_t>(sizeof header + body.size());
        header.error = body.empty() ? -ENOSYS : 0;
        header.unique = request.unique;
        std::vector<char> reply = Answer(header);
        reply.insert(reply.end(), body.begin(), body.end());
        if (::write(device_, reply.data(), reply.size()) < 0 && errno == ENODEV) {
            return;
        }
    }
}

} // namespace VANO::TESTS
