// The administrators' notification: one run of the notification tool.

#include <fileindex/notification.h>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

class NotificationTest : public LibraryTest {};

TEST_F(NotificationTest, RunsTheToolOnceAndWaitsForIt) {
    EXPECT_TRUE(NotifyNoSpace());
    EXPECT_THAT(
        platform.Trace(),
        ElementsAre(
            "VLIBCExecv(/usr/vano/bin/vanozemnotify, [/usr/vano/bin/vanozemnotify, -e, false, -c, "
            "VANO.KWX.AdminCenter.Application, @administrators, fileindex:fileindex_title, "
            "fileindex:notify_no_space, "
            "<a data-vano-app=\"VANO.KWX.AdminCenter.Application\" "
            "data-vano-fn=\"VANO.KWX.AdminCenter.MediaIndex.Main\" data-vano-tab=\"fileIndex\">, "
            "</a>], 1)"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(NotificationTest, AnythingButZeroIsAFailure) {
    for (const int result : {-1, 1, 2, 127, 255, 256}) {
        platform.Answer("VLIBCExecv", {result});
        EXPECT_FALSE(NotifyNoSpace()) << result;
    }
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 6U) << "nothing is retried";
    EXPECT_TRUE(NotifyNoSpace());
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
}

} // namespace

} // namespace VANO::TESTS
