// The tests write to /usr/vano, /run, /tmp and /dev/log, so they run only where those are private.

#include <gmock/gmock.h>

#include "support/files.h"

int main(int argc, char **argv) {
    VANO::TESTS::RequireSandbox();
    ::testing::InitGoogleMock(&argc, argv);
    return RUN_ALL_TESTS();
}
