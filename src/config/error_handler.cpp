#include <fileindex/error_handler.h>

namespace VANO::FILEINDEX {

_tag_fileindex_err_ ErrorHandler::g_error_code = FILEINDEX_ERR_NONE;

void ErrorHandler::SetError(_tag_fileindex_err_ code) {
    g_error_code = code;
}

_tag_fileindex_err_ ErrorHandler::GetError() {
    return g_error_code;
}

} // namespace VANO::FILEINDEX
