// With the real programs of Samba on a private configuration.

#include <gtest/gtest.h>
#include <unistd.h>

#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/mounts.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;

constexpr char kSettings[] = "/etc/samba/smb.conf";

class SpotlightTest : public ::testing::Test {
  protected:
    void SetUp() override {
        if (::access("/usr/bin/testparm", X_OK) != 0 || ::access("/usr/bin/net", X_OK) != 0) {
            GTEST_SKIP() << "Samba's programs are not installed";
        }
        MakeDirs("/var/lib/samba/private");
        MakeDirs("/run/samba");
        VLIBCErrSetEx(0, "", 0);
    }
    void TearDown() override {
        RemoveTree(kSettings);
        RemoveTree("/var/lib/samba/registry.tdb");
    }
};

TEST_F(SpotlightTest, IsOffByDefault) {
    PutFile(kSettings, "[global]\n");
    EXPECT_EQ(0, VANOSMBIsEnableSpotlight());
    EXPECT_EQ(0, VLIBCErrGet()) << "off is no failure";
}

TEST_F(SpotlightTest, ReadsTheSettingsFile) {
    PutFile(kSettings, "[global]\nspotlight = yes\n");
    EXPECT_EQ(1, VANOSMBIsEnableSpotlight());
}

TEST_F(SpotlightTest, IsSwitchedInTheIncludedRegistry) {
    PutFile(kSettings, "[global]\ninclude = registry\n");
    EXPECT_EQ(0, VANOSMBSetSpotlight(true));
    EXPECT_EQ(1, VANOSMBIsEnableSpotlight());
    EXPECT_TRUE(Shell("net conf getparm global spotlight && grep -qx yes /tmp/shell.out"));
    EXPECT_EQ(0, VANOSMBSetSpotlight(false));
    EXPECT_EQ(0, VANOSMBIsEnableSpotlight());
}

TEST_F(SpotlightTest, IsSwitchedInTheRegistryThatIsTheWholeConfiguration) {
    PutFile(kSettings, "[global]\nconfig backend = registry\n");
    EXPECT_EQ(0, VANOSMBSetSpotlight(true));
    EXPECT_EQ(1, VANOSMBIsEnableSpotlight());
}

TEST_F(SpotlightTest, SettingWhatIsInForceSucceeds) {
    PutFile(kSettings, "[global]\nspotlight = yes\n");
    EXPECT_EQ(0, VANOSMBSetSpotlight(true));
    EXPECT_FALSE(Exists("/var/lib/samba/registry.tdb"));
}

TEST_F(SpotlightTest, ARegistryThatIsNotIncludedIsAFailure) {
    PutFile(kSettings, "[global]\n");
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrRegistryNotInUse, VLIBCErrGet());
    EXPECT_EQ(0, VANOSMBIsEnableSpotlight());
}

TEST_F(SpotlightTest, ASettingAfterTheIncludeIsAFailure) {
    PutFile(kSettings, "[global]\ninclude = registry\nspotlight = no\n");
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrRegistryNotInUse, VLIBCErrGet());
}

TEST_F(SpotlightTest, WithoutAConfigurationItIsOffAndCannotBeSet) {
    EXPECT_EQ(0, VANOSMBIsEnableSpotlight());
    EXPECT_EQ(kErrNoSamba, VLIBCErrGet());
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrNoSamba, VLIBCErrGet());
}

TEST_F(SpotlightTest, WithoutSambaItIsOffAndCannotBeSet) {
    PutFile(kSettings, "[global]\ninclude = registry\nspotlight = yes\n");
    PutFile("/tmp/empty", "");
    const Mount noTestparm = Cover("/usr/bin/testparm", "/tmp/empty");
    ASSERT_TRUE(noTestparm);
    EXPECT_EQ(0, VANOSMBIsEnableSpotlight());
    EXPECT_EQ(kErrNoSamba, VLIBCErrGet());
    VLIBCErrSetEx(0, "", 0);
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrNoSamba, VLIBCErrGet());
}

TEST_F(SpotlightTest, WithoutTheToolThatWritesItCannotBeSet) {
    PutFile(kSettings, "[global]\ninclude = registry\n");
    PutFile("/tmp/empty", "");
    const Mount noNet = Cover("/usr/bin/net", "/tmp/empty");
    ASSERT_TRUE(noNet);
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrNoSamba, VLIBCErrGet());
}

TEST_F(SpotlightTest, AFailingWriteIsAFailure) {
    PutFile(kSettings, "[global]\ninclude = registry\n");
    ASSERT_TRUE(Shell("cp /bin/false /tmp/false && chmod 755 /tmp/false"));
    const Mount failing = Cover("/usr/bin/net", "/tmp/false");
    ASSERT_TRUE(failing);
    EXPECT_LT(VANOSMBSetSpotlight(true), 0);
    EXPECT_EQ(kErrSambaWrite, VLIBCErrGet());
}

} // namespace
