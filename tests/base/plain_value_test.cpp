// A settings text is what the JSON library says, whoever reads it.

#include "base/plain_value.h"

#include "base/json_io.h"
#include "support/fixture.h"
#include "support/json_texts.h"

namespace VANO::TESTS {

namespace {

class PlainValueTest : public LibraryTest {};

TEST_F(PlainValueTest, EveryTextIsReadAsTheJsonLibraryReadsIt) {
    JsonTexts texts(19990101);
    JsonParser parser;
    const std::size_t count = TextCount() / 4; // each is longer than an event
    std::size_t valid = 0;
    std::size_t plain = 0;
    for (std::size_t number = 0; number < count; ++number) {
        const std::string text = texts.Settings();
        Json::Value expected = "untouched";
        Json::Value value = "untouched";
        const bool isValid = parser.ParseWithLibrary(expected, text);
        ASSERT_EQ(parser.Parse(value, text), isValid)
            << "text " << number << ": " << ::testing::PrintToString(text);
        ASSERT_EQ(value, expected) << "text " << number << ": " << ::testing::PrintToString(text);
        valid += isValid ? 1 : 0;
        plain += ReadPlainValue(value, text) ? 1 : 0;
    }
    // The texts are of every kind.
    EXPECT_GT(plain, count / 10);
    EXPECT_GT(valid - plain, count / 100);
    EXPECT_GT(count - valid, count / 10);
}

// An array that an element was set of, beyond its end: those between are null.
TEST_F(PlainValueTest, AnArrayWithHolesIsWrittenWhole) {
    Json::Value array(Json::arrayValue);
    array[2] = true;
    EXPECT_EQ(JsonToString(array), "[null,null,true]");
    Json::Value object(Json::objectValue);
    object["a"][1] = Json::Value(Json::arrayValue);
    EXPECT_EQ(JsonToString(object), R"({"a":[null,[]]})");
}

TEST_F(PlainValueTest, UsualSettingsNeedNoJsonLibrary) {
    const char *const kTexts[] = {
        R"({"/photos/ü":{"audio":false,"document":true,"name":"Ü","path":"/photos/ü"}})",
        R"({"no_space":{"photos":true},"resume_time":1700000000})", R"({"resume_time":-1})",
        "{ \"a\" : [ 1, null ],\n \"b\" : {} }\n"};
    for (const char *text : kTexts) {
        Json::Value value;
        EXPECT_TRUE(ReadPlainValue(value, text)) << text;
    }
}

} // namespace

} // namespace VANO::TESTS
