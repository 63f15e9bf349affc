// The kernels that tests run on mostly lack quotas, so the quota call is answered here; everything
// else reaches the kernel.

#include <cerrno>
#include <climits>
#include <cstdarg>
#include <ctime>
#include <dlfcn.h>
#include <functional>
#include <gtest/gtest.h>
#include <linux/quota.h>
#include <sys/statvfs.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/mounts.h"

namespace {

struct QuotaCall {
    unsigned command;
    uid_t user;
    if_dqblk *quota;
};

// Returns 0 or an errno; empty for the kernel's own answer.
std::function<int(const QuotaCall &)> answerQuota;

} // namespace

// It looks at six arguments however many there are.
extern "C" __attribute__((visibility("default"), no_sanitize("address"))) long
syscall(long number, ...) noexcept {
    va_list list;
    va_start(list, number);
    long arguments[6];
    for (long &argument : arguments) {
        argument = va_arg(list, long);
    }
    va_end(list);
    if (number == SYS_quotactl_fd && answerQuota) {
        const int error =
            answerQuota({static_cast<unsigned>(arguments[1]), static_cast<uid_t>(arguments[2]),
                         reinterpret_cast<if_dqblk *>(arguments[3])});
        errno = error != 0 ? error : errno;
        return error != 0 ? -1 : 0;
    }
    static const auto real = reinterpret_cast<long (*)(long, ...)>(::dlsym(RTLD_NEXT, "syscall"));
    return real(number, arguments[0], arguments[1], arguments[2], arguments[3], arguments[4],
                arguments[5]);
}

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;

constexpr char kVolume[] = "/tmp/volume";
constexpr long long kMiB = 1024 * 1024;

class RoomTest : public ::testing::Test {
  protected:
    void SetUp() override {
        MakeDirs(kVolume);
        VLIBCErrSetEx(0, "", 0);
    }
    void TearDown() override {
        answerQuota = nullptr;
        RemoveTree(kVolume);
    }

    // Limits and use in bytes; the time of grace ends `graceLeft` seconds from now, 0 for not
    // running.
    static void SetQuota(long long used, long long hard, long long soft = 0, long graceLeft = 0) {
        answerQuota = [=](const QuotaCall &call) {
            EXPECT_EQ(static_cast<unsigned>(QCMD(Q_GETQUOTA, USRQUOTA)), call.command);
            EXPECT_EQ(::geteuid(), call.user);
            call.quota->dqb_curspace = static_cast<__u64>(used);
            call.quota->dqb_bhardlimit = static_cast<__u64>(hard / QIF_DQBLKSIZE);
            call.quota->dqb_bsoftlimit = static_cast<__u64>(soft / QIF_DQBLKSIZE);
            call.quota->dqb_btime =
                graceLeft == 0 ? 0 : static_cast<__u64>(std::time(nullptr) + graceLeft);
            return 0;
        };
    }
};

TEST_F(RoomTest, AnEmptyVolumeHasRoomUpToItsSize) {
    const Mount mount("none", kVolume, "tmpfs", 0, "size=4m");
    ASSERT_TRUE(mount);
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, 0));
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, 4 * kMiB));
    EXPECT_EQ(0, VLIBCErrGet());
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, 4 * kMiB + 1));
    EXPECT_EQ(0x2900, VLIBCErrGet());
}

TEST_F(RoomTest, AFullVolumeHasNone) {
    const Mount mount("none", kVolume, "tmpfs", 0, "size=4m");
    ASSERT_TRUE(mount);
    PutFile("/tmp/volume/file", std::string(3 * kMiB, 'x'));
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, kMiB / 2));
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, 2 * kMiB));
    EXPECT_EQ(0x2900, VLIBCErrGet());
}

TEST_F(RoomTest, TheLargestNumberIsNoOverflow) {
    const Mount mount("none", kVolume, "tmpfs", 0, "size=4m");
    ASSERT_TRUE(mount);
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, LLONG_MAX));
    EXPECT_EQ(0x2900, VLIBCErrGet());
}

TEST_F(RoomTest, AVolumeWithoutASizeHasRoom) {
    const Mount mount("none", kVolume, "ramfs");
    if (!mount) {
        GTEST_SKIP() << "no ramfs can be mounted here";
    }
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, 100 * kMiB));
}

TEST_F(RoomTest, BlocksKeptBackAreForRootOnly) {
    if (!Shell("truncate -s 16M /tmp/reserved && mkfs.ext4 -q -m 40 /tmp/reserved")) {
        GTEST_SKIP() << "no image can be made";
    }
    const Mount mount("/tmp/reserved", kVolume);
    if (!mount || ::geteuid() != 0) {
        GTEST_SKIP() << "the image cannot be mounted";
    }
    struct statvfs info {};
    ASSERT_EQ(0, ::statvfs(kVolume, &info));
    ASSERT_GT(info.f_bfree, info.f_bavail);
    const auto middle = static_cast<long long>((info.f_bfree + info.f_bavail) / 2 * info.f_frsize);
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, middle));
    if (::seteuid(65534) != 0) {
        GTEST_SKIP() << "there is one user only here";
    }
    const int enough = VANOQuotaIsEnough(0, kVolume, middle);
    const int error = VLIBCErrGet();
    ASSERT_EQ(0, ::seteuid(0));
    EXPECT_EQ(0, enough);
    EXPECT_EQ(0x2900, error);
}

TEST_F(RoomTest, FailuresOfTheCheckHaveAnotherCode) {
    EXPECT_EQ(0, VANOQuotaIsEnough(0, "/tmp/none", 1));
    EXPECT_EQ(kErrRoomCheck, VLIBCErrGet());
    PutFile("/tmp/volume/file", "");
    EXPECT_EQ(0, VANOQuotaIsEnough(0, "/tmp/volume/file", 1));
    EXPECT_EQ(kErrRoomCheck, VLIBCErrGet());
    EXPECT_EQ(0, VANOQuotaIsEnough(0, nullptr, 1));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, -1));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
}

TEST_F(RoomTest, TheHardLimitIsExact) {
    SetQuota(3 * kMiB, 4 * kMiB);
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, kMiB));
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, kMiB + 1));
    EXPECT_EQ(0x2400, VLIBCErrGet());
}

TEST_F(RoomTest, UseBeyondTheHardLimitIsNoOverflow) {
    SetQuota(5 * kMiB, 4 * kMiB);
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, 0));
    EXPECT_EQ(0x2400, VLIBCErrGet());
}

TEST_F(RoomTest, NoLimitIsNoRefusal) {
    SetQuota(5 * kMiB, 0);
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, kMiB));
}

TEST_F(RoomTest, TheSoftLimitHoldsOnceGraceIsOver) {
    SetQuota(3 * kMiB, 0, 2 * kMiB, +3600);
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, kMiB));
    SetQuota(3 * kMiB, 0, 2 * kMiB, -3600);
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, kMiB));
    EXPECT_EQ(0x2400, VLIBCErrGet());
    SetQuota(kMiB, 0, 2 * kMiB); // not beyond it yet
    EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, 3 * kMiB));
}

TEST_F(RoomTest, WithoutQuotaSupportThereIsNoLimit) {
    for (const int error : {ESRCH, ENOENT, ENOSYS, EOPNOTSUPP, EINVAL, ENOTBLK}) {
        answerQuota = [error](const QuotaCall &) { return error; };
        EXPECT_NE(0, VANOQuotaIsEnough(0, kVolume, kMiB)) << error;
    }
}

TEST_F(RoomTest, AQuotaThatCannotBeReadIsAFailureOfTheCheck) {
    answerQuota = [](const QuotaCall &) { return EIO; };
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, kMiB));
    EXPECT_EQ(kErrRoomCheck, VLIBCErrGet());
}

TEST_F(RoomTest, TheExceededQuotaIsNamedBeforeTheFullVolume) {
    const Mount mount("none", kVolume, "tmpfs", 0, "size=4m");
    ASSERT_TRUE(mount);
    SetQuota(0, kMiB);
    EXPECT_EQ(0, VANOQuotaIsEnough(0, kVolume, 100 * kMiB));
    EXPECT_EQ(0x2400, VLIBCErrGet());
}

} // namespace
