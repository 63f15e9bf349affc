// The tests write to /usr/vano, /run, /tmp and /dev/log, so they run only where those are private.

#include <cstdio>
#include <gmock/gmock.h>
#include <unistd.h>

int main(int argc, char **argv) {
    if (::access("/.fileindex-sandbox", F_OK) != 0) {
        std::fputs("This test changes system paths; run it through scripts/sandbox.\n", stderr);
        return 2;
    }
    ::testing::InitGoogleMock(&argc, argv);
    return RUN_ALL_TESTS();
}
