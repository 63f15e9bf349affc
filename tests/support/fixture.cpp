#include "support/fixture.h"

#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>

namespace VANO::TESTS {

void LibraryTest::SetUp() {
    (void)SystemLog::Get();
    Fault::Reset();
    EmptyAppliance();
    platform.Reset();
    LOG_LEVEL = 3;
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    (void)SystemLog::Get().Lines();
    EventTrace::Get().Clear();
    descriptors_ = OpenDescriptors();
}

void LibraryTest::TearDown() {
    Fault::Reset();
    EXPECT_FALSE(IsLocked(kFolderLock)) << "the lock on the folder settings was left";
    EXPECT_FALSE(IsLocked(kStatusLock)) << "the lock on the status was left";
    int leaks = 0;
    std::string leaked;
    for (const auto &[fd, target] : OpenDescriptors()) {
        if (descriptors_.count(fd) == 0) {
            ++leaks;
            leaked += "\n  " + target;
            const KitScope kit;
            ::close(fd);
        }
    }
    EXPECT_EQ(leaks, expectedLeaks_) << "descriptors left open:" << leaked;
    for (const auto &[fd, target] : descriptors_) {
        EXPECT_NE(::fcntl(fd, F_GETFD), -1) << "closed a descriptor of others: " << target;
    }
    EXPECT_EQ(platform.LiveRecords(), 0U) << "share records were not released";
    EXPECT_EQ(platform.LiveMonitorQueues(), 0) << "monitor queues were not destroyed";
    EXPECT_THAT(platform.Violations(), ::testing::IsEmpty());
    if (!strayFilesAllowed_) {
        EXPECT_THAT(NamesIn(kSettingsDirectory),
                    ::testing::Each(::testing::AnyOf("folder.conf", "status.conf")));
    }
    for (const LogLine &line : SystemLog::Get().Lines()) {
        ADD_FAILURE() << "unexpected log line: " << line.text;
    }
}

void LibraryTest::ExpectLog(const std::vector<std::string> &texts, const char *file, int line) {
    SystemLog::Get().Expect(texts, file, line);
}

void LibraryTest::ExpectError(_tag_fileindex_err_ code, const char *file, int line) {
    if (ErrorHandler::GetError() != code) {
        ADD_FAILURE_AT(file, line)
            << "expected the last error " << code << ", it is " << ErrorHandler::GetError();
    }
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
}

} // namespace VANO::TESTS
