#include <gtest/gtest.h>
#include <string>
#include <thread>

#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"

namespace {

TEST(ErrorTest, KeepsWhatWasSet) {
    VLIBCErrSetEx(0x1234, "some_file.cpp", 77);
    EXPECT_EQ(0x1234, VLIBCErrGet());
    EXPECT_STREQ("some_file.cpp", VLIBCErrorGetFile());
    EXPECT_EQ(77, VLIBCErrorGetLine());
}

TEST(ErrorTest, KeepsTheFileNameWhenItsOwnerIsGone) {
    {
        std::string file = "short_lived.cpp";
        VLIBCErrSetEx(1, file.c_str(), 1);
        file.assign(file.size(), 'x');
    }
    EXPECT_STREQ("short_lived.cpp", VLIBCErrorGetFile());
}

TEST(ErrorTest, TakesANullFile) {
    VLIBCErrSetEx(5, nullptr, 6);
    EXPECT_EQ(5, VLIBCErrGet());
    EXPECT_STREQ("", VLIBCErrorGetFile());
}

TEST(ErrorTest, IsEachThreadsOwn) {
    VLIBCErrSetEx(0x2400, "main.cpp", 1);
    int before = -1;
    int after = -1;
    std::thread([&] {
        before = VLIBCErrGet();
        VLIBCErrSetEx(0x2900, "thread.cpp", 2);
        after = VLIBCErrGet();
    }).join();
    EXPECT_EQ(0, before);
    EXPECT_EQ(0x2900, after);
    EXPECT_EQ(0x2400, VLIBCErrGet());
    EXPECT_STREQ("main.cpp", VLIBCErrorGetFile());
}

TEST(ErrorTest, FailuresNameAShortFileAndALine) {
    VLIBCErrSetEx(0, "", 0);
    EXPECT_LT(VANOEAMKDir(0, nullptr), 0);
    EXPECT_EQ(VANO::PLATFORM::kErrBadParameter, VLIBCErrGet());
    EXPECT_STREQ("metadata_dir.cpp", VLIBCErrorGetFile());
    EXPECT_GT(VLIBCErrorGetLine(), 0);
}

} // namespace
