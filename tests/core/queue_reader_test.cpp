// The queue file's lines and what counts as an event. The reader is hidden in the library: it is
// linked a second time.

#include "core/queue_reader.h"

#include "core/event.h"
#include "core/share_files.h"
#include "support/fixture.h"

#include <climits>
#include <fcntl.h>
#include <fstream>
#include <malloc.h>
#include <sys/stat.h>
#include <unistd.h>

namespace VANO::TESTS {

namespace {

constexpr char kQueue[] = "/volume1/queue";
constexpr std::size_t kBuffer = std::size_t{64} * 1024;

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kMemoryIsOurs = false;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
constexpr bool kMemoryIsOurs = false;
#else
constexpr bool kMemoryIsOurs = true;
#endif
#else
constexpr bool kMemoryIsOurs = true;
#endif

// The most that this process had since ForgetPeakMemory(), in KiB.
long PeakMemory() {
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line)) {
        if (line.rfind("VmHWM:", 0) == 0) {
            return std::stol(line.substr(6));
        }
    }
    return -1;
}

void ForgetPeakMemory() {
    ::malloc_trim(0);
    std::ofstream("/proc/self/clear_refs") << 5;
}

class QueueReaderTest : public LibraryTest {
  protected:
    static std::vector<std::string> LinesOf(std::string_view text) {
        PutFile(kQueue, text);
        QueueReader reader{ShareFile(kQueue)};
        EXPECT_TRUE(reader.IsOpen());
        std::vector<std::string> lines;
        std::string_view line = "left over";
        while (reader.NextLine(line)) {
            lines.emplace_back(line);
        }
        EXPECT_FALSE(reader.NextLine(line)) << "there is nothing after the end";
        return lines;
    }

    bool IsEvent(QueueEvent &event, std::string_view line) { return parser_.Parse(event, line); }

  private:
    EventParser parser_;
};

// --- lines ----------------------------------------------------------------------------------

TEST_F(QueueReaderTest, SplitsAtNewlines) {
    EXPECT_THAT(LinesOf(""), IsEmpty());
    EXPECT_THAT(LinesOf("a\n"), ElementsAre("a"));
    EXPECT_THAT(LinesOf("a\nb\n"), ElementsAre("a", "b"));
    EXPECT_THAT(LinesOf("\n"), ElementsAre(""));
    EXPECT_THAT(LinesOf("\n\n\na\n\n"), ElementsAre("", "", "", "a", ""));
}

TEST_F(QueueReaderTest, TheLastLineNeedsNoNewline) {
    EXPECT_THAT(LinesOf("a"), ElementsAre("a"));
    EXPECT_THAT(LinesOf("a\nb"), ElementsAre("a", "b"));
    EXPECT_THAT(LinesOf("\n "), ElementsAre("", " "));
}

TEST_F(QueueReaderTest, NothingElseEndsALine) {
    const std::string zero("a\0b\n", 4);
    EXPECT_THAT(LinesOf(zero), ElementsAre(zero.substr(0, 3)));
    EXPECT_THAT(LinesOf("a\r\nb\r\n"), ElementsAre("a\r", "b\r"));
    EXPECT_THAT(LinesOf("a\rb\n"), ElementsAre("a\rb"));
    EXPECT_THAT(LinesOf("\xff\xfe\n\x80"), ElementsAre("\xff\xfe", "\x80"));
}

TEST_F(QueueReaderTest, LinesMayEndAnywhereInTheBuffer) {
    for (const std::size_t size : {kBuffer - 2, kBuffer - 1, kBuffer, kBuffer + 1, 2 * kBuffer - 1,
                                   2 * kBuffer, 2 * kBuffer + 1, 5 * kBuffer}) {
        const std::string line(size, 'x');
        EXPECT_THAT(LinesOf(line), ElementsAre(line)) << size;
        EXPECT_THAT(LinesOf(line + "\n"), ElementsAre(line)) << size;
        EXPECT_THAT(LinesOf(line + "\n\n"), ElementsAre(line, "")) << size;
        EXPECT_THAT(LinesOf(line + "\nsecond\n"), ElementsAre(line, "second")) << size;
        EXPECT_THAT(LinesOf("first\n" + line + "\nthird"), ElementsAre("first", line, "third"))
            << size;
    }
}

TEST_F(QueueReaderTest, ManyLinesKeepTheirOrder) {
    std::string text;
    std::vector<std::string> expected;
    for (int number = 0; number < 50000; ++number) {
        expected.push_back("line " + std::to_string(number));
        text += expected.back() + "\n";
    }
    EXPECT_EQ(LinesOf(text), expected);
}

TEST_F(QueueReaderTest, ShortReadsChangeNothing) {
    Fault::Before(Call::Read, [](CallInfo &info) { info.size = 1; });
    EXPECT_THAT(LinesOf("ab\n\ncd\ne"), ElementsAre("ab", "", "cd", "e"));
}

TEST_F(QueueReaderTest, AnInterruptedReadIsRepeated) {
    Fault::On(Call::Read, [reads = 0](CallInfo &info) mutable -> std::optional<long> {
        info.size = 2;
        if (++reads % 2 == 0) {
            return std::nullopt;
        }
        errno = EINTR;
        return -1;
    });
    EXPECT_THAT(LinesOf("abc\nd\n"), ElementsAre("abc", "d"));
}

TEST_F(QueueReaderTest, AReadErrorIsTheEnd) {
    Fault::On(Call::Read, [reads = 0](CallInfo &info) mutable -> std::optional<long> {
        info.size = 6;
        if (++reads < 3) {
            return std::nullopt;
        }
        errno = EIO;
        return -1;
    });
    EXPECT_THAT(LinesOf("a\nb\nc\nd\ne\nf\ng\nh\n"), ElementsAre("a", "b", "c", "d", "e", "f"));
}

TEST_F(QueueReaderTest, WhatIsAppendedMeanwhileIsRead) {
    PutFile(kQueue, "a\n");
    QueueReader reader{ShareFile(kQueue)};
    std::string_view line;
    ASSERT_TRUE(reader.NextLine(line));
    PutFile(kQueue, "a\nb\n");
    ASSERT_TRUE(reader.NextLine(line));
    EXPECT_EQ(line, "b");
    EXPECT_FALSE(reader.NextLine(line));
}

TEST_F(QueueReaderTest, AMissingQueueIsNotOpen) {
    const QueueReader reader{ShareFile(kQueue)};
    EXPECT_EQ(errno, ENOENT);
    EXPECT_FALSE(reader.IsOpen());
}

TEST_F(QueueReaderTest, ASymbolicLinkIsNotFollowed) {
    PutFile("/volume1/target", "a\n");
    ASSERT_EQ(::symlink("/volume1/target", kQueue), 0);
    const QueueReader reader{ShareFile(kQueue)};
    EXPECT_EQ(errno, ELOOP);
    EXPECT_FALSE(reader.IsOpen());
}

TEST_F(QueueReaderTest, OnlyARegularFileIsOpenedAndNothingBlocks) {
    const auto expectRefused = [](const char *what) {
        errno = 0;
        QueueReader reader{ShareFile(kQueue)};
        EXPECT_EQ(errno, EINVAL) << what;
        EXPECT_FALSE(reader.IsOpen()) << what;
        std::string_view line;
        EXPECT_FALSE(reader.NextLine(line)) << what;
    };
    ASSERT_EQ(::mkfifo(kQueue, 0600), 0);
    expectRefused("a FIFO");
    {
        std::fstream writer(kQueue, std::ios::in | std::ios::out); // holds it open, writes nothing
        ASSERT_TRUE(writer.is_open());
        expectRefused("a FIFO with a writer");
    }
    ASSERT_EQ(::unlink(kQueue), 0);
    MakeDirs(kQueue);
    expectRefused("a directory");
}

TEST_F(QueueReaderTest, DescriptorsAreNotInheritedAndAreClosed) {
    PutFile(kQueue, "a\n");
    Fault::Count(Call::Open);
    Fault::Count(Call::OpenPath);
    Fault::Count(Call::Close);
    { const QueueReader reader{ShareFile(kQueue)}; }
    ASSERT_EQ(Fault::Log(Call::Open).size(), 1U);
    for (const int flag : {O_NOFOLLOW, O_NONBLOCK, O_NOCTTY, O_CLOEXEC}) {
        EXPECT_EQ(Fault::Log(Call::Open)[0].number & flag, flag) << flag;
    }
    for (const CallInfo &directory : Fault::Log(Call::OpenPath)) {
        EXPECT_EQ(directory.number & O_CLOEXEC, O_CLOEXEC) << directory.path;
    }
    EXPECT_EQ(Fault::Calls(Call::Close), 1U + Fault::Calls(Call::OpenPath));
}

// --- events ---------------------------------------------------------------------------------

TEST_F(QueueReaderTest, AnEventIsAnObjectWithACodeAndAPath) {
    const struct {
        const char *line;
        unsigned int code;
        const char *path;
    } kRows[] = {
        {R"({"event":65536,"path":"/v/a","data":{}})", 65536, "/v/a"},
        {R"({"path":"/v/a","event":65536})", 65536, "/v/a"},
        {R"({"event":0,"path":""})", 0, ""},
        {R"({"event":4294967295,"path":"a"})", UINT_MAX, "a"},
        {R"({"event":65536.0,"path":"a"})", 65536, "a"},
        {R"({"event":6.5536e4,"path":"a"})", 65536, "a"},
        {R"({"event":true,"path":"a"})", 1, "a"},
        {R"({"event":false,"path":"a"})", 0, "a"},
        {R"({"event":null,"path":"a"})", 0, "a"},
        {R"({"event":1,"path":"a","event":2})", 2, "a"}, // the last one counts
        {R"({"path":"a","event":1,"path":"b"})", 1, "b"},
        {" \t{ \"event\" : 1 , \"path\" : \"a\" } \r", 1, "a"}, // white space, CR included
        {"{\"event\":1,\"path\":\"\xff\xfe\"}", 1, "\xff\xfe"}, // bytes, not UTF-8
        {R"({"event":1,"path":"\u00fc\n\"\\\/"})", 1, "\xc3\xbc\n\"\\/"},
        {R"({"event":1,"path":"// no comment","data":["/*",",}"]})", 1, "// no comment"},
    };
    for (const auto &row : kRows) {
        QueueEvent event{};
        EXPECT_TRUE(IsEvent(event, row.line)) << row.line;
        EXPECT_EQ(event.code, row.code) << row.line;
        EXPECT_EQ(event.path, row.path) << row.line;
        EXPECT_EQ(event.formerPath, "") << row.line;
    }
}

TEST_F(QueueReaderTest, AnythingElseIsNoEvent) {
    const std::string deep = std::string(5000, '[') + std::string(5000, ']');
    const std::vector<std::string> lines = {"",
                                            " ",
                                            "\r",
                                            "x",
                                            "[]",
                                            "null",
                                            "1",
                                            "\"a\"",
                                            "{}",
                                            "{",
                                            R"({"event":1})",
                                            R"({"path":"a"})",
                                            R"({"event":1,"path":null})",
                                            R"({"event":1,"path":1})",
                                            R"({"event":1,"path":["a"]})",
                                            R"({"event":1,"path":{}})",
                                            R"({"event":1,"path":true})",
                                            R"({"event":"1","path":"a"})",
                                            R"({"event":"65536","path":"a"})",
                                            R"({"event":-1,"path":"a"})",
                                            R"({"event":4294967296,"path":"a"})",
                                            R"({"event":18446744073709551616,"path":"a"})",
                                            R"({"event":-0.5e300,"path":"a"})",
                                            R"({"event":4294967295.5,"path":"a"})",
                                            R"({"event":[],"path":"a"})",
                                            R"({"event":{},"path":"a"})",
                                            R"({"event":[1],"path":"a"})",
                                            R"({"event":1,"path":"a","event":"x"})",
                                            R"({"event":1,"path":"a","path":1})",
                                            R"([{"event":1,"path":"a"}])",
                                            R"({"event":1,"path":"a"}{"event":1,"path":"a"})",
                                            R"({"event":1,"path":"a"} x)",
                                            R"({"event":1,"path":"a",})",
                                            R"({"event":1,"path":"a")",
                                            R"({"event":1,"path":"a"} // c)",
                                            R"(/* c */{"event":1,"path":"a"})",
                                            "{\"event\":1,/* c */\"path\":\"a\"}",
                                            R"({'event':1,'path':'a'})",
                                            R"({event:1,path:"a"})",
                                            R"({"Event":1,"Path":"a"})",
                                            R"({"event":0x1,"path":"a"})",
                                            R"({"event":NaN,"path":"a"})",
                                            R"({"event":1,"path":"a","data":)" + deep + "}",
                                            std::string("{\"event\":1,\"path\":\"a\"}\0", 23),
                                            std::string("{\"event\":1,\"path\":\"a\"}\0x", 24)};
    for (const std::string &line : lines) {
        QueueEvent event{};
        EXPECT_FALSE(IsEvent(event, line)) << line.substr(0, 100);
    }
}

TEST_F(QueueReaderTest, AFormerPathIsWhatReadsAsText) {
    const struct {
        const char *value;
        const char *formerPath;
    } kRows[] = {{"\"/v/b\"", "/v/b"}, {"\"\"", ""},       {"null", ""},     {"[]", ""},
                 {"{}", ""},           {"[\"/v/b\"]", ""}, {"{\"a\":1}", ""}};
    for (const auto &row : kRows) {
        QueueEvent event{};
        event.formerPath = "of the line before";
        const std::string line =
            std::string(R"({"event":256,"path":"a","path_old":)") + row.value + "}";
        EXPECT_TRUE(IsEvent(event, line));
        EXPECT_EQ(event.formerPath, row.formerPath) << row.value;
    }
    QueueEvent event{};
    event.formerPath = "of the line before";
    EXPECT_TRUE(IsEvent(event, R"({"event":256,"path":"a"})"));
    EXPECT_EQ(event.formerPath, "");
}

TEST_F(QueueReaderTest, OnlyAMoveHasAFormerPath) {
    for (const char *line : {R"({"event":2,"path":"a","path_old":"b"})",
                             R"({"event":2,"path":"a","path_old":"\u0062"})"}) {
        QueueEvent event{};
        EXPECT_TRUE(IsEvent(event, line)) << line;
        EXPECT_EQ(event.formerPath, "") << line;
    }
}

TEST_F(QueueReaderTest, AnEventMayBeNearlyAMebibyteLong) {
    const std::string data((std::size_t{1} << 20) - 100, 'x');
    PutFile(kQueue,
            R"({"event":7,"path":"a","data":")" + data + "\"}\n" + R"({"event":8,"path":"b"})");
    QueueReader reader{ShareFile(kQueue)};
    std::string_view line;
    QueueEvent event{};
    ASSERT_TRUE(reader.NextLine(line));
    EXPECT_TRUE(IsEvent(event, line));
    EXPECT_EQ(event.code, 7U);
    ASSERT_TRUE(reader.NextLine(line));
    EXPECT_TRUE(IsEvent(event, line));
    EXPECT_EQ(event.code, 8U);
}

TEST_F(QueueReaderTest, ALineBeyondTheLimitIsCutAndIsNoEvent) {
    // White space, so that what is left of the cut line would be an event.
    const std::string object = R"({"event":1,"path":"a"})";
    const std::string longest = object + std::string((std::size_t{1} << 20) - object.size(), ' ');
    for (const bool cut : {false, true}) {
        PutFile(kQueue, longest + (cut ? " \nlast" : "\nlast"));
        QueueReader reader{ShareFile(kQueue)};
        std::string_view line;
        QueueEvent event{};
        ASSERT_TRUE(reader.NextLine(line));
        EXPECT_TRUE(line == longest + (cut ? "..." : "")) << "has " << line.size() << " bytes";
        EXPECT_EQ(IsEvent(event, line), !cut);
        ASSERT_TRUE(reader.NextLine(line));
        EXPECT_EQ(line, "last");
        EXPECT_FALSE(reader.NextLine(line));
    }
}

TEST_F(QueueReaderTest, MemoryDoesNotGrowWithALineWithoutEnd) {
    if (!kMemoryIsOurs) {
        GTEST_SKIP() << "a sanitizer keeps what was freed";
    }
    constexpr off_t kGigabyte = off_t{1} << 30;
    PutFile(kQueue, "");
    ASSERT_EQ(::truncate(kQueue, kGigabyte), 0); // a hole: one line of zero bytes
    ForgetPeakMemory();
    const long before = PeakMemory();
    ASSERT_GT(before, 0);
    QueueReader reader{ShareFile(kQueue)};
    std::string_view line;
    EXPECT_TRUE(reader.NextLine(line));
    EXPECT_FALSE(reader.NextLine(line));
    EXPECT_LT(PeakMemory() - before, 4 * 1024); // the limit, and what growing to it takes
}

TEST_F(QueueReaderTest, MemoryDoesNotGrowWithTheFile) {
    if (!kMemoryIsOurs) {
        GTEST_SKIP() << "a sanitizer keeps what was freed";
    }
    constexpr int kLines = 16 * 1024;
    const std::string event =
        R"({"event":1,"path":"/v/a","data":")" + std::string(4000, 'x') + "\"}\n";
    {
        std::ofstream queue(kQueue, std::ios::binary);
        for (int number = 0; number < kLines; ++number) {
            queue << event;
        }
    }
    ForgetPeakMemory();
    const long before = PeakMemory();
    ASSERT_GT(before, 0);
    QueueReader reader{ShareFile(kQueue)};
    std::string_view line;
    QueueEvent parsed{};
    int events = 0;
    while (reader.NextLine(line)) {
        events += IsEvent(parsed, line) ? 1 : 0;
    }
    EXPECT_EQ(events, kLines);
    EXPECT_LT(PeakMemory() - before, 16 * 1024);
}

} // namespace

} // namespace VANO::TESTS
