#include <algorithm>
#include <gtest/gtest.h>
#include <random>
#include <string>
#include <vector>

#include "platform/vano_platform.h"

namespace {

int Sign(int value) {
    return (value > 0) - (value < 0);
}

struct Row {
    const char *name;
    std::string a;
    std::string b;
    int sign;
};

class CaseFoldTest : public ::testing::TestWithParam<Row> {};

TEST_P(CaseFoldTest, Compares) {
    const Row &row = GetParam();
    EXPECT_EQ(row.sign, Sign(VLIBCUnicodeUTF8StrCaseCmp(row.a.c_str(), row.b.c_str())));
    EXPECT_EQ(-row.sign, Sign(VLIBCUnicodeUTF8StrCaseCmp(row.b.c_str(), row.a.c_str())));
}

INSTANTIATE_TEST_SUITE_P(
    Table, CaseFoldTest,
    ::testing::Values(
        Row{"Empty", "", "", 0}, Row{"EmptyFirst", "", "a", -1}, Row{"Same", "photos", "photos", 0},
        Row{"AsciiCase", "PhoTOS", "pHotos", 0}, Row{"Prefix", "Photo", "photos", -1},
        Row{"FoldedNotByteOrder", "B", "a", 1}, // "B" is below "a" by bytes
        Row{"UnderscoreBelowFoldedLetters", "_", "Z", -1},
        Row{"DigitsBelowLetters", "file10", "fileA", -1},
        Row{"Umlaut", "\u00C4pfel", "\u00E4PFEL", 0}, Row{"UmlautIsNoA", "\u00E4", "a", 1},
        Row{"SharpS", "stra\u00DFe", "STRASSE", 0}, Row{"CapitalSharpS", "\u1E9E", "ss", 0},
        Row{"SharpSPrefix", "\u00DF", "sss", -1}, Row{"HalfASharpS", "s", "\u00DF", -1},
        Row{"FinalSigma", "\u039F\u03A3", "\u03BF\u03C2", 0},
        Row{"DotlessIIsNoI", "\u0131", "I", 1},
        Row{"DottedCapitalIKeepsItsDot", "\u0130", "i\u0307", 0},
        Row{"DottedCapitalIIsNoI", "\u0130", "i", 1}, Row{"LigatureFfi", "\uFB03", "FFI", 0},
        Row{"Cyrillic", "\u0424\u041E\u0422\u041E", "\u0444\u043E\u0442\u043E", 0},
        Row{"BeyondTheFirstPlane", "\U00010400", "\U00010428", 0},
        Row{"PlanesByCodePoint", "\uFFFD", "\U0001F4F7", -1},
        Row{"Han", "\u5199\u771F", "\u5199\u771F", 0},
        Row{"NoNormalisation", "\u00E9", "e\u0301", 1},
        Row{"InvalidAfterEveryValid", "\xFF", "\U0010FFFF", 1},
        Row{"InvalidEqualsItself", "a\xC3", "A\xC3", 0},
        Row{"InvalidBytesByValue", "\xC3", "\xE9", -1},
        Row{"CutSequence", "\xE2\x82", "\xE2\x82\xAC", 1},
        Row{"LoneContinuation", "\x80", "\xBF", -1}, Row{"Overlong", "\xC0\xAF", "/", 1},
        Row{"Surrogate", "\xED\xA0\x80", "\uFFFF", 1},
        Row{"BeyondUnicode", "\xF4\x90\x80\x80", "\U0010FFFF", 1},
        Row{"EndAfterInvalid", "\xFF",
            "\xFF"
            "a",
            -1}),
    [](const auto &row) { return row.param.name; });

TEST(CaseFoldTest, NullComesFirst) {
    EXPECT_EQ(0, VLIBCUnicodeUTF8StrCaseCmp(nullptr, nullptr));
    EXPECT_LT(VLIBCUnicodeUTF8StrCaseCmp(nullptr, ""), 0);
    EXPECT_GT(VLIBCUnicodeUTF8StrCaseCmp("", nullptr), 0);
}

// Letters whose foldings overlap, whole and broken sequences: what an order could stumble over.
std::vector<std::string> RandomTexts(std::size_t count) {
    const std::vector<std::string> pieces = {"a",        "A",      "s",      "S",          "\u00DF",
                                             "\u1E9E",   "i",      "I",      "\u0130",     "\u0131",
                                             "\u0307",   "\u03C2", "\u03A3", "\xC3",       "\x9F",
                                             "\xE2\x82", "\xFF",   "/",      "\U00010400", "\x80"};
    std::mt19937 random(20261121);
    std::vector<std::string> texts;
    for (std::size_t i = 0; i < count; ++i) {
        std::string text;
        for (auto length = random() % 5; length > 0; --length) {
            text += random() % 4 == 0 ? std::string(1, static_cast<char>(1 + random() % 255))
                                      : pieces[random() % pieces.size()];
        }
        texts.push_back(text);
    }
    return texts;
}

TEST(CaseFoldTest, IsAStrictWeakOrder) {
    const auto texts = RandomTexts(120);
    const auto compare = [](const std::string &a, const std::string &b) {
        return Sign(VLIBCUnicodeUTF8StrCaseCmp(a.c_str(), b.c_str()));
    };
    int equalPairs = 0;
    for (const auto &a : texts) {
        ASSERT_EQ(0, compare(a, a));
        for (const auto &b : texts) {
            ASSERT_EQ(compare(a, b), -compare(b, a));
            equalPairs += a != b && compare(a, b) == 0;
            for (const auto &c : texts) {
                if (compare(a, b) <= 0 && compare(b, c) <= 0) {
                    const int expected = std::min(compare(a, b), compare(b, c));
                    ASSERT_EQ(expected, compare(a, c));
                }
            }
        }
    }
    EXPECT_GT(equalPairs, 0) << "the sample holds no different texts that are equal";
}

} // namespace
