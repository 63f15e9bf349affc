#include "base/json_io.h"

#include <cerrno>
#include <limits>
#include <sys/stat.h>
#include <unistd.h>

#include "support/fixture.h"
#include "support/memory_fault.h"
#include "support/mounts.h"

namespace VANO::TESTS {

namespace {

constexpr char kFile[] = "/volume1/file.json";

class JsonIoTest : public LibraryTest {};

std::string Nested(std::size_t depth) {
    return std::string(depth, '[') + std::string(depth, ']');
}

// --- texts ---

struct TextRow {
    const char *what;
    std::string text;
};

void PrintTo(const TextRow &row, std::ostream *out) {
    *out << row.text.substr(0, 60);
}

class JsonValidTextTest : public JsonIoTest, public ::testing::WithParamInterface<TextRow> {};

TEST_P(JsonValidTextTest, IsRead) {
    Json::Value value = "before";
    EXPECT_TRUE(JsonFromString(value, GetParam().text));
    EXPECT_NE(value, Json::Value("before"));
}

INSTANTIATE_TEST_SUITE_P(
    Texts, JsonValidTextTest,
    ::testing::Values(
        TextRow{"Object", R"({"a":1})"}, TextRow{"EmptyObject", "{}"}, TextRow{"EmptyArray", "[]"},
        TextRow{"Array", "[1,[2],{}]"}, TextRow{"String", R"("text")"}, TextRow{"Number", "12"},
        TextRow{"Negative", "-1.5e3"}, TextRow{"True", "true"}, TextRow{"Null", "null"},
        TextRow{"SpaceAround", " \t\r\n{ } \t\r\n"},
        TextRow{"SlashInAString", R"({"/photos//a":"/* no comment */"})"},
        TextRow{"CommaAndBraceInAString", R"({"a":",}"})"},
        TextRow{"EscapedQuoteInAString", R"({"a":"\",}//"})"},
        TextRow{"EscapedBackslashAtTheEnd", R"({"a":"\\"})"}, TextRow{"EmptyName", R"({"":1})"},
        TextRow{"NotUtf8", "{\"\xff\":\"\xc3\"}"}, TextRow{"Depth", Nested(900)},
        // What the JSON library takes beyond the standard.
        TextRow{"LeadingZero", R"({"a":007})"}, TextRow{"NegativeZeros", "-007"},
        TextRow{"RawTabInAString", "\"a\tb\""}, TextRow{"RawNewlineInAName", "{\"a\nb\":1}"},
        TextRow{"ZeroByteInAString", std::string("\"a\0b\"", 5)}),
    RowName());

class JsonInvalidTextTest : public JsonIoTest, public ::testing::WithParamInterface<TextRow> {};

TEST_P(JsonInvalidTextTest, IsRefusedAndTheValueStays) {
    Json::Value value = "before";
    EXPECT_FALSE(JsonFromString(value, GetParam().text));
    EXPECT_EQ(value, Json::Value("before"));
}

TEST_P(JsonInvalidTextTest, IsRefusedInAFile) {
    PutFile(kFile, GetParam().text);
    Json::Value value = "before";
    EXPECT_FALSE(JsonFromFile(value, kFile));
    EXPECT_EQ(value, Json::Value("before"));
}

INSTANTIATE_TEST_SUITE_P(
    Texts, JsonInvalidTextTest,
    ::testing::Values(
        TextRow{"Empty", ""}, TextRow{"SpaceOnly", " \n"}, TextRow{"Truncated", R"({"a":)"},
        TextRow{"TruncatedString", R"({"a":"b)"}, TextRow{"Unclosed", "[1"}, TextRow{"Word", "x"},
        TextRow{"Extra", "{} x"}, TextRow{"TwoValues", "{}{}"}, TextRow{"ExtraBrace", "{}}"},
        TextRow{"ZeroByteAfter", std::string("{}\0", 3)},
        TextRow{"ZeroByteAndTextAfter", std::string("{}\0x", 4)},
        TextRow{"ZeroByteInside", std::string("{\0}", 3)}, TextRow{"CommentBefore", "// c\n{}"},
        TextRow{"CommentAfter", "{} // c\n"}, TextRow{"BlockCommentBefore", "/* c */{}"},
        TextRow{"CommentInObject", "{/* c */\"a\":1}"},
        TextRow{"LineCommentInObject", "{\"a\":1// c\n}"},
        TextRow{"CommentInArray", "[1,/* c */2]"}, TextRow{"CommentInEmptyArray", "[/* c */]"},
        TextRow{"TrailingCommaInObject", R"({"a":1,})"}, TextRow{"TrailingCommaInArray", "[1,]"},
        TextRow{"TrailingCommaAndSpace", "{\"a\":1, \n}"},
        TextRow{"TrailingCommaAfterEmptyName", R"({"":1,})"}, TextRow{"MissingElement", "[1,,2]"},
        TextRow{"LeadingComma", "[,1]"}, TextRow{"SingleQuotes", "{'a':1}"},
        TextRow{"BareName", "{a:1}"}, TextRow{"NumericName", "{1:2}"}, TextRow{"NotANumber", "NaN"},
        TextRow{"Infinity", "Infinity"}, TextRow{"BadEscape", R"("\x")"},
        TextRow{"CutEscape", R"("\u12")"}, TextRow{"TooDeep", Nested(5000)},
        TextRow{"FarTooDeep", Nested(1000000)},
        TextRow{"TooDeepObject",
                [] {
                    std::string text;
                    for (int i = 0; i < 3000; ++i) {
                        text += "{\"a\":";
                    }
                    return text + "1" + std::string(3000, '}');
                }()}),
    RowName());

TEST_F(JsonIoTest, AParserReadsOneTextAfterAnother) {
    JsonParser parser;
    Json::Value value;
    EXPECT_TRUE(parser.Parse(value, R"({"a":1})"));
    EXPECT_FALSE(parser.Parse(value, "{"));
    EXPECT_FALSE(parser.Parse(value, Nested(5000)));
    EXPECT_EQ(value, Json(R"({"a":1})"));
    EXPECT_TRUE(parser.Parse(value, "[2]"));
    EXPECT_EQ(value, Json("[2]"));
}

TEST_F(JsonIoTest, TextIsCompactOnOneLineWithoutNewline) {
    EXPECT_EQ(JsonToString(Json(R"({ "b" : [1, 2],
                                     "a" : {"c": true, "d": null} })")),
              R"({"a":{"c":true,"d":null},"b":[1,2]})");
    EXPECT_EQ(JsonToString(Json::Value(Json::objectValue)), "{}");
    EXPECT_EQ(JsonToString(Json::Value()), "null");
}

// Whether the text of `value` is whole, or thrown away, whichever request for memory is refused.
void ExpectWholeTextWithoutMemory(const Json::Value &value) {
    const std::string whole = JsonToString(value);
    long refused = 0;
    long requests = 0;
    do { // until all that it asked for was granted
        ++refused;
        std::string text = whole;
        ArmMemoryFault({refused, false});
        try {
            text = JsonToString(value);
        } catch (const std::exception &) {
        }
        requests = DisarmMemoryFault();
        EXPECT_TRUE(text == whole) << "refused " << refused << ": " << text.size() << " bytes";
    } while (requests >= refused);
    EXPECT_GT(refused, 1) << "nothing was refused";
}

TEST_F(JsonIoTest, ATextForWhichThereIsNoMemoryIsNotCutShort) {
    Json::Value value(Json::objectValue);
    value["name"] = std::string(5000, 'x');
    ExpectWholeTextWithoutMemory(value);
    value["other"] = "\n"; // which only the JSON library writes
    ExpectWholeTextWithoutMemory(value);
}

TEST_F(JsonIoTest, NewlinesInAStringAreEscaped) {
    EXPECT_EQ(JsonToString(Json::Value("a\nb\"\\")), R"("a\nb\"\\")");
}

TEST_F(JsonIoTest, EveryByteOfAStringComesBack) {
    std::string bytes;
    for (int byte = 0; byte < 256; ++byte) {
        bytes += static_cast<char>(byte);
    }
    Json::Value value(Json::objectValue);
    value[bytes] = bytes;
    Json::Value back;
    ASSERT_TRUE(JsonFromString(back, JsonToString(value)));
    EXPECT_EQ(back, value);
}

TEST_F(JsonIoTest, CharactersBeyondAsciiAreNotEscaped) {
    EXPECT_EQ(JsonToString(Json::Value("/ph\xc3\xb6to/\xff\xe2\x82\xac")),
              "\"/ph\xc3\xb6to/\xff\xe2\x82\xac\"");
}

TEST_F(JsonIoTest, LargeIntegersComeBack) {
    for (const Json::Int64 number :
         {std::numeric_limits<Json::Int64>::min(), std::numeric_limits<Json::Int64>::max()}) {
        Json::Value back;
        ASSERT_TRUE(JsonFromString(back, JsonToString(Json::Value(number))));
        EXPECT_EQ(back.asInt64(), number);
    }
}

TEST_F(JsonIoTest, TheMessageTextOfAStringIsTheStringAndOfOthersCompactJson) {
    EXPECT_EQ(JsonToMessageText(Json::Value("/a \"b\"\n")), "/a \"b\"\n");
    EXPECT_EQ(JsonToMessageText(Json(R"({"a": [1]})")), R"({"a":[1]})");
    EXPECT_EQ(JsonToMessageText(Json::Value()), "null");
    EXPECT_EQ(JsonToMessageText(Json::Value(12)), "12");
}

// --- files ---

TEST_F(JsonIoTest, AFileComesBack) {
    const Json::Value value = Json(R"({"/photos":{"name":"a\nb","audio":true}})");
    EXPECT_TRUE(JsonToFile(value, kFile));
    Json::Value back;
    EXPECT_TRUE(JsonFromFile(back, kFile));
    EXPECT_EQ(back, value);
    EXPECT_EQ(ReadText(kFile).find('\n'), std::string::npos);
}

TEST_F(JsonIoTest, WhatIsNoReadableFileIsRefusedAndTheValueStays) {
    MakeDirs("/volume1/directory");
    ASSERT_EQ(::mkfifo("/volume1/fifo", 0600), 0);
    ASSERT_EQ(::symlink("/volume1/none", "/volume1/dangling"), 0);
    ASSERT_EQ(::symlink("/volume1/loop", "/volume1/loop"), 0);
    for (const char *path : {"/volume1/directory", "/volume1/fifo", "/volume1/none",
                             "/volume1/dangling", "/volume1/loop", "", "/dev/zero"}) {
        Json::Value value = "before";
        EXPECT_FALSE(JsonFromFile(value, path)) << path;
        EXPECT_EQ(value, Json::Value("before")) << path;
    }
}

TEST_F(JsonIoTest, APathBeyondTheSystemsLimitIsRefused) {
    Json::Value value = "before";
    EXPECT_FALSE(JsonFromFile(value, "/" + std::string(4096, 'a')));
    EXPECT_FALSE(JsonToFile(value, "/" + std::string(4096, 'a')));
}

TEST_F(JsonIoTest, AHugeFileIsRefused) {
    PutFile(kFile, "{}");
    ASSERT_EQ(::truncate(kFile, static_cast<off_t>(kMaxJsonFileBytes) + 1), 0);
    Json::Value value = "before";
    EXPECT_FALSE(JsonFromFile(value, kFile));
    EXPECT_EQ(errno, EFBIG);
    EXPECT_EQ(value, Json::Value("before"));
}

TEST_F(JsonIoTest, WhatCouldNotBeReadBackIsNotWritten) {
    PutFile(kFile, "{}");
    const Json::Value value(std::string(kMaxJsonFileBytes, 'x'));
    EXPECT_FALSE(JsonToFile(value, kFile));
    EXPECT_EQ(errno, EFBIG);
    EXPECT_EQ(ReadText(kFile), "{}");
}

TEST_F(JsonIoTest, AFullDiskLeavesTheOldFile) {
    const Mount volume = TinyVolume("/volume2/tiny", 32 * 1024);
    ASSERT_TRUE(volume);
    PutFile("/volume2/tiny/file", "{}");
    EXPECT_FALSE(JsonToFile(Json::Value(std::string(64 * 1024, 'x')), "/volume2/tiny/file"));
    EXPECT_EQ(ReadText("/volume2/tiny/file"), "{}");
}

} // namespace

} // namespace VANO::TESTS
