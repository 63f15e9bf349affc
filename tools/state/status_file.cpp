#include "state/status_file.h"

#include <fileindex/error_handler.h>
#include <fileindex/status.h>

namespace CTL {

namespace fileindex = VANO::FILEINDEX;

bool LoadStatus(Json::Value &status) {
    fileindex::Status file;
    if (!file.Load()) {
        return false;
    }
    if (!file.root.isObject()) {
        fileindex::ErrorHandler::SetError(fileindex::FILEINDEX_ERR_MALFORMED);
        return false;
    }
    status = file.root;
    return true;
}

} // namespace CTL
