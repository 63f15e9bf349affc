#include <fileindex/error_handler.h>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

// Taken before any test runs.
const _tag_fileindex_err_ g_codeAtStart = ErrorHandler::GetError();

class ErrorHandlerTest : public LibraryTest {};

TEST_F(ErrorHandlerTest, NothingHasFailedAtLoadTime) {
    EXPECT_EQ(g_codeAtStart, FILEINDEX_ERR_NONE);
}

TEST_F(ErrorHandlerTest, CodesHaveTheirNumbers) {
    EXPECT_EQ(FILEINDEX_ERR_NONE, 0);
    EXPECT_EQ(FILEINDEX_ERR_BAD_PARAM, 1);
    EXPECT_EQ(FILEINDEX_ERR_PATH, 2);
    EXPECT_EQ(FILEINDEX_ERR_RESERVED, 3);
    EXPECT_EQ(FILEINDEX_ERR_NO_SUCH_FOLDER, 4);
    EXPECT_EQ(FILEINDEX_ERR_FOLDER_LIMIT, 5);
    EXPECT_EQ(FILEINDEX_ERR_LOAD, 6);
    EXPECT_EQ(FILEINDEX_ERR_SAVE, 7);
    EXPECT_EQ(FILEINDEX_ERR_MALFORMED, 8);
    EXPECT_EQ(FILEINDEX_ERR_LOCK, 9);
    EXPECT_EQ(sizeof(_tag_fileindex_err_), 4U);
}

TEST_F(ErrorHandlerTest, TheLastCodeSetIsTheOneGot) {
    for (int code = 0; code <= 9; ++code) {
        ErrorHandler::SetError(static_cast<_tag_fileindex_err_>(code));
        EXPECT_EQ(ErrorHandler::GetError(), code);
        EXPECT_EQ(ErrorHandler::g_error_code, code);
    }
    ErrorHandler::g_error_code = FILEINDEX_ERR_SAVE;
    EXPECT_EQ(ErrorHandler::GetError(), FILEINDEX_ERR_SAVE);
}

TEST_F(ErrorHandlerTest, NothingIsLogged) {
    ErrorHandler::SetError(FILEINDEX_ERR_LOCK);
    ExpectLog({});
}

} // namespace

} // namespace VANO::TESTS
