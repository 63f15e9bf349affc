// A settings text is what the JSON library says, whoever reads or writes it.

#include "base/plain_value.h"

#include <json/writer.h>

#include "base/json_io.h"
#include "support/fixture.h"
#include "support/json_texts.h"

namespace VANO::TESTS {

namespace {

class PlainValueTest : public LibraryTest {
  protected:
    PlainValueTest() {
        library_["indentation"] = "";
        library_["commentStyle"] = "None";
        library_["emitUTF8"] = true;
    }

    // The text that a value must be written as.
    [[nodiscard]] std::string ByLibrary(const Json::Value &value) const {
        return Json::writeString(library_, value);
    }

  private:
    Json::StreamWriterBuilder library_;
};

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

TEST_F(PlainValueTest, EveryValueIsWrittenAsTheJsonLibraryWritesIt) {
    JsonTexts texts(20010203);
    JsonParser parser;
    const std::size_t count = TextCount() / 4;
    std::size_t values = 0;
    std::size_t plain = 0;
    for (std::size_t number = 0; number < count; ++number) {
        Json::Value value;
        if (!parser.ParseWithLibrary(value, texts.Settings())) {
            continue;
        }
        const std::string expected = ByLibrary(value);
        ASSERT_EQ(JsonToString(value), expected) << "text " << number;
        std::string text;
        ++values;
        if (WritePlainValue(text, value)) {
            ++plain;
            ASSERT_EQ(text, expected) << "text " << number;
        }
    }
    EXPECT_GT(plain, count / 10);
    EXPECT_GT(values - plain, count / 100);
}

// Of each byte alone, and of the numbers that no text above has.
TEST_F(PlainValueTest, EveryByteAndNumberIsWrittenAsTheJsonLibraryWritesIt) {
    Json::Value value(Json::objectValue);
    for (int byte = 0; byte < 256; ++byte) {
        const std::string text(1, static_cast<char>(byte));
        value = Json::Value(Json::objectValue);
        value[text] = text + "a" + text;
        EXPECT_EQ(JsonToString(value), ByLibrary(value)) << byte;
    }
    const Json::Value kNumbers[] = {Json::Value::minLargestInt,
                                    Json::Value::maxLargestInt,
                                    Json::Value::maxLargestUInt,
                                    Json::Value::maxUInt,
                                    0,
                                    0U,
                                    -1,
                                    0.0,
                                    -0.0,
                                    0.1,
                                    1e17,
                                    2.0};
    for (const Json::Value &number : kNumbers) {
        EXPECT_EQ(JsonToString(number), ByLibrary(number));
    }
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

TEST_F(PlainValueTest, WhatIsNestedDeeplyIsWrittenByTheJsonLibrary) {
    for (int levels = 14; levels < 20; ++levels) {
        Json::Value array(7);
        Json::Value object(7);
        for (int level = 0; level < levels; ++level) {
            Json::Value outer(Json::arrayValue);
            outer.append(array);
            array.swap(outer);
            outer = Json::Value(Json::objectValue);
            outer["a"] = object;
            object.swap(outer);
        }
        EXPECT_EQ(JsonToString(array), ByLibrary(array)) << levels;
        EXPECT_EQ(JsonToString(object), ByLibrary(object)) << levels;
        std::string text;
        EXPECT_EQ(WritePlainValue(text, array), levels <= 16) << levels;
        EXPECT_EQ(WritePlainValue(text, object), levels <= 16) << levels;
    }
}

TEST_F(PlainValueTest, UsualSettingsNeedNoJsonLibrary) {
    const char *const kTexts[] = {
        R"({"/photos/ü":{"audio":false,"document":true,"name":"Ü","path":"/photos/ü"}})",
        R"({"no_space":{"photos":true},"resume_time":1700000000})", R"({"resume_time":-1})",
        "{ \"a\" : [ 1, null ],\n \"b\" : {} }\n"};
    for (const char *text : kTexts) {
        Json::Value value;
        EXPECT_TRUE(ReadPlainValue(value, text)) << text;
        std::string written;
        EXPECT_TRUE(WritePlainValue(written, value)) << text;
    }
}

} // namespace

} // namespace VANO::TESTS
