#include <fileindex/notification.h>

#include "core/paths.h"
#include "platform/vano_platform.h"

namespace VANO::FILEINDEX {

namespace {

// What the text puts around its link to the indexing page.
constexpr char kLinkBegin[] =
    "<a data-vano-app=\"VANO.KWX.AdminCenter.Application\" "
    "data-vano-fn=\"VANO.KWX.AdminCenter.MediaIndex.Main\" data-vano-tab=\"fileIndex\">";
constexpr char kLinkEnd[] = "</a>";

} // namespace

bool NotifyNoSpace() {
    const char *const arguments[] = {
        kNotifyToolPath,
        "-e",
        "false",
        "-c", // the web application that the notification opens
        "VANO.KWX.AdminCenter.Application",
        "@administrators",
        "fileindex:fileindex_title",
        "fileindex:notify_no_space",
        kLinkBegin,
        kLinkEnd,
        nullptr,
    };
    return VLIBCExecv(kNotifyToolPath, arguments, 1) == 0;
}

} // namespace VANO::FILEINDEX
