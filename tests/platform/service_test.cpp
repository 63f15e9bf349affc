#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <sys/stat.h>
#include <vector>

#include "platform/diagnosis.h"
#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/mounts.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;
using ::testing::ElementsAre;

constexpr char kCalls[] = "/tmp/calls";

void PutProgram(const std::string &path, const std::string &text) {
    PutFile(path, "#!/bin/sh\n" + text);
    ASSERT_EQ(0, ::chmod(path.c_str(), 0755));
}

// The calls that the fakes wrote down since the last look.
std::vector<std::string> Calls() {
    std::vector<std::string> lines;
    std::string text = ReadIfThere(kCalls).value_or("");
    RemoveTree(kCalls);
    for (std::size_t end = 0; (end = text.find('\n')) != std::string::npos;
         text.erase(0, end + 1)) {
        lines.push_back(text.substr(0, end));
    }
    return lines;
}

// --- SysV ----------------------------------------------------------------------------------------

class SysvTest : public ::testing::Test {
  protected:
    void SetUp() override { PutScript("fileindexd"); }
    void TearDown() override {
        RemoveTree("/etc/init.d");
        MakeDirs("/etc/init.d");
        RemoveTree(kCalls);
    }

    // Fails for the actions named in `failing`.
    static void PutScript(const std::string &name, const std::string &failing = "none") {
        PutProgram("/etc/init.d/" + name,
                   "### BEGIN INIT INFO\n# Provides: " + name +
                       "\n# Required-Start:\n# Required-Stop:\n# Default-Start: 2 3 4 5\n"
                       "# Default-Stop: 0 1 6\n# Short-Description: x\n### END INIT INFO\n"
                       "echo \"" +
                       name + " $1\" >>" + kCalls + "\n[ \"$1\" != " + failing + " ]\n");
    }
    static bool StartsAtBoot() { return Shell("ls /etc/rc2.d/S*fileindexd"); }
};

TEST_F(SysvTest, StartsStopsAndRestartsTheScript) {
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 0));
    EXPECT_EQ(0, VLIBServiceRestart("fileindexd"));
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 0));
    EXPECT_THAT(Calls(), ElementsAre("fileindexd start", "fileindexd restart", "fileindexd stop"));
    EXPECT_FALSE(StartsAtBoot());
}

TEST_F(SysvTest, TheFlagEnablesAndDisablesAtBoot) {
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 1));
    EXPECT_TRUE(StartsAtBoot());
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 1));
    EXPECT_FALSE(StartsAtBoot());
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 1));
    EXPECT_TRUE(StartsAtBoot());
    EXPECT_THAT(Calls(), ElementsAre("fileindexd start", "fileindexd stop", "fileindexd start"));
}

TEST_F(SysvTest, StoppingANeverEnabledServiceWithTheFlagSucceeds) {
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 1));
    EXPECT_FALSE(StartsAtBoot());
}

TEST_F(SysvTest, OtherFlagsLeaveTheBootAlone) {
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 2));
    EXPECT_FALSE(StartsAtBoot());
}

TEST_F(SysvTest, WithoutUpdateRcTheServiceIsStillStarted) {
    PutFile("/tmp/empty", "");
    const Mount cover = Cover("/usr/sbin/update-rc.d", "/tmp/empty");
    ASSERT_TRUE(cover);
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 1));
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 1));
    EXPECT_THAT(Calls(), ElementsAre("fileindexd start", "fileindexd stop"));
}

TEST_F(SysvTest, AFailingScriptIsAFailure) {
    PutScript("fileindexd", "start");
    EXPECT_LT(VLIBServiceStart("fileindexd", 0), 0);
    EXPECT_EQ(kErrServiceAction, VLIBCErrGet());
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 0));
    PutScript("fileindexd", "stop");
    EXPECT_LT(VLIBServiceStop("fileindexd", 0), 0);
    EXPECT_EQ(kErrServiceAction, VLIBCErrGet());
    PutScript("fileindexd", "restart");
    EXPECT_LT(VLIBServiceRestart("fileindexd"), 0);
    EXPECT_EQ(kErrServiceAction, VLIBCErrGet());
}

TEST_F(SysvTest, AFailingEnableIsAFailureButTheServiceIsStarted) {
    PutProgram("/tmp/failing", "exit 1\n");
    const Mount cover = Cover("/usr/sbin/update-rc.d", "/tmp/failing");
    ASSERT_TRUE(cover);
    EXPECT_LT(VLIBServiceStart("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceBoot, VLIBCErrGet());
    EXPECT_LT(VLIBServiceStop("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceBoot, VLIBCErrGet());
    EXPECT_THAT(Calls(), ElementsAre("fileindexd start", "fileindexd stop"));
}

TEST_F(SysvTest, AMissingScriptIsNoSuchService) {
    EXPECT_LT(VLIBServiceStart("nothing", 0), 0);
    EXPECT_EQ(kErrNoSuchService, VLIBCErrGet());
    EXPECT_LT(VLIBServiceRestart("samba"), 0);
    EXPECT_EQ(kErrNoSuchService, VLIBCErrGet());
}

TEST_F(SysvTest, WithoutTheServiceProgramThereIsNoServiceControl) {
    PutFile("/tmp/empty", "");
    const Mount cover = Cover("/usr/sbin/service", "/tmp/empty");
    ASSERT_TRUE(cover);
    EXPECT_LT(VLIBServiceStart("fileindexd", 0), 0);
    EXPECT_EQ(kErrNoServiceControl, VLIBCErrGet());
}

TEST_F(SysvTest, NamesThatAreOptionsOrPathsAreRefused) {
    for (const char *name :
         {"", "-h", "--status-all", "../fileindexd", "a/b", ".hidden", "a b", "a;b"}) {
        VLIBCErrSetEx(0, "", 0);
        EXPECT_LT(VLIBServiceStart(name, 0), 0) << name;
        EXPECT_EQ(kErrBadParameter, VLIBCErrGet()) << name;
    }
    EXPECT_LT(VLIBServiceStart(nullptr, 0), 0);
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_THAT(Calls(), ElementsAre());
}

TEST_F(SysvTest, SambaIsWhatTheDistributionCallsIt) {
    for (const char *name : {"samba", "smb", "smbd"}) { // each takes the place of the one before
        PutScript(name);
        EXPECT_EQ(0, VLIBServiceRestart("samba"));
        EXPECT_THAT(Calls(), ElementsAre(std::string(name) + " restart"));
    }
}

TEST_F(SysvTest, TheCommandToTypeIsThatOfTheServiceProgram) {
    EXPECT_EQ("service fileindexd restart", ServiceCommand("restart", "fileindexd"));
    PutScript("smbd");
    EXPECT_EQ("service smbd restart", ServiceCommand("restart", "samba"));
    EXPECT_EQ("", ServiceCommand("restart", "-h"));
    PutFile("/tmp/empty", "");
    const Mount cover = Cover("/usr/sbin/service", "/tmp/empty");
    ASSERT_TRUE(cover);
    EXPECT_EQ("", ServiceCommand("restart", "fileindexd"));
}

// --- systemd -------------------------------------------------------------------------------------

class SystemdTest : public ::testing::Test {
  protected:
    void SetUp() override {
        MakeDirs("/run/systemd/system");
        PutSystemctl("none");
        // Whether or not the machine has one.
        programs_ = std::make_unique<Mount>("overlay", "/usr/bin", "overlay", MS_RDONLY,
                                            "lowerdir=/tmp/programs:/usr/bin");
        ASSERT_TRUE(*programs_) << "systemctl cannot be replaced";
    }
    void TearDown() override {
        programs_.reset();
        RemoveTree("/run/systemd");
        RemoveTree("/etc/systemd/system/smb.service");
        RemoveTree("/etc/systemd/system/smbd.service");
        RemoveTree(kCalls);
    }

    // It must never ask anybody for a password: the caller holds a lock meanwhile.
    static void PutSystemctl(const std::string &failing) {
        MakeDirs("/tmp/programs");
        PutProgram("/tmp/programs/systemctl",
                   std::string("[ \"$1\" = --no-ask-password ] || exit 9; shift\n"
                               "echo \"$*\" >>") +
                       kCalls + "\n[ \"$1\" != " + failing + " ]\n");
    }

    std::unique_ptr<Mount> programs_;
};

TEST_F(SystemdTest, StartsStopsAndRestartsTheUnit) {
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 0));
    EXPECT_EQ(0, VLIBServiceRestart("fileindexd"));
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 0));
    EXPECT_THAT(Calls(), ElementsAre("start fileindexd", "restart fileindexd", "stop fileindexd"));
}

TEST_F(SystemdTest, TheFlagEnablesBeforeTheStartAndDisablesAfterTheStop) {
    EXPECT_EQ(0, VLIBServiceStart("fileindexd", 1));
    EXPECT_THAT(Calls(), ElementsAre("enable fileindexd", "start fileindexd"));
    EXPECT_EQ(0, VLIBServiceStop("fileindexd", 1));
    EXPECT_THAT(Calls(), ElementsAre("stop fileindexd", "disable fileindexd"));
}

TEST_F(SystemdTest, BothStepsAreTriedWhicheverFails) {
    PutSystemctl("enable");
    EXPECT_LT(VLIBServiceStart("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceBoot, VLIBCErrGet());
    EXPECT_THAT(Calls(), ElementsAre("enable fileindexd", "start fileindexd"));
    PutSystemctl("start");
    EXPECT_LT(VLIBServiceStart("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceAction, VLIBCErrGet());
    PutSystemctl("stop");
    (void)Calls();
    EXPECT_LT(VLIBServiceStop("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceAction, VLIBCErrGet());
    EXPECT_THAT(Calls(), ElementsAre("stop fileindexd", "disable fileindexd"));
    PutSystemctl("disable");
    EXPECT_LT(VLIBServiceStop("fileindexd", 1), 0);
    EXPECT_EQ(kErrServiceBoot, VLIBCErrGet());
}

TEST_F(SystemdTest, TheCommandToTypeIsThatOfSystemctl) {
    EXPECT_EQ("systemctl restart fileindexd", ServiceCommand("restart", "fileindexd"));
    EXPECT_THAT(Calls(), ElementsAre()) << "it is not run";
}

TEST_F(SystemdTest, SambaIsTheUnitThatIsInstalled) {
    PutFile("/etc/systemd/system/smb.service", "[Unit]\n");
    EXPECT_EQ(0, VLIBServiceRestart("samba"));
    EXPECT_THAT(Calls(), ElementsAre("restart smb"));
    PutFile("/etc/systemd/system/smbd.service", "[Unit]\n");
    EXPECT_EQ(0, VLIBServiceRestart("samba"));
    EXPECT_THAT(Calls(), ElementsAre("restart smbd"));
}

TEST_F(SystemdTest, AMaskedSambaUnitIsPassedOver) {
    PutFile("/etc/systemd/system/smb.service", "[Unit]\n");
    ASSERT_TRUE(Shell("ln -s /dev/null /etc/systemd/system/smbd.service"));
    EXPECT_EQ(0, VLIBServiceRestart("samba"));
    EXPECT_THAT(Calls(), ElementsAre("restart smb"));
}

TEST_F(SystemdTest, AMaskHidesTheUnitOfThePackage) {
    MakeDirs("/run/systemd/system");
    PutFile("/run/systemd/system/smbd.service", "[Unit]\n");
    PutFile("/etc/systemd/system/smb.service", "[Unit]\n");
    ASSERT_TRUE(Shell("ln -s /dev/null /etc/systemd/system/smbd.service"));
    EXPECT_EQ(0, VLIBServiceRestart("samba"));
    EXPECT_THAT(Calls(), ElementsAre("restart smb"));
}

TEST_F(SystemdTest, WithoutSystemctlThereIsNoServiceControl) {
    PutFile("/tmp/empty", "");
    const Mount cover = Cover("/usr/bin/systemctl", "/tmp/empty");
    ASSERT_TRUE(cover);
    EXPECT_LT(VLIBServiceStart("fileindexd", 0), 0);
    EXPECT_EQ(kErrNoServiceControl, VLIBCErrGet());
}

} // namespace
