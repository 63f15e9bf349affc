#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::HasSubstr;

struct Question {
    const char *what;
    Words arguments;
    int status;
    const char *answer;

    friend void PrintTo(const Question &question, std::ostream *out) { *out << question.what; }
};

class QueryTest : public CtlTest, public ::testing::WithParamInterface<Question> {};

TEST_P(QueryTest, IsAnswered) {
    Save(kTwo);
    const Outcome outcome = Ctl(GetParam().arguments);
    EXPECT_EQ(outcome.status, GetParam().status);
    EXPECT_EQ(outcome.out, GetParam().answer);
    EXPECT_EQ(outcome.error, "");
}

INSTANTIATE_TEST_SUITE_P(
    Questions, QueryTest,
    ::testing::Values(
        Question{"Folder", {"query", "/photos"}, kDone, "indexed  /photos\n"},
        Question{"Below", {"query", "/photos/2016/a.jpg"}, kDone, "indexed  /photos/2016/a.jpg\n"},
        Question{"Above", {"query", "/media"}, kNotFound, "not indexed  /media\n"},
        Question{"Sibling", {"query", "/photos2"}, kNotFound, "not indexed  /photos2\n"},
        Question{"FinalSlash", {"query", "/photos/"}, kNotFound, "not indexed  /photos/\n"},
        Question{"Several",
                 {"query", "/photos", "/x"},
                 kNotFound,
                 "indexed      /photos\nnot indexed  /x\n"},
        Question{"FullPath",
                 {"query", "--full-path", "/volume2/media/films/a"},
                 kDone,
                 "indexed  /volume2/media/films/a\n"},
        Question{"FullPathToldApart",
                 {"query", "/volume2/media/films/a", "/volume2/media"},
                 kNotFound,
                 "indexed      /volume2/media/films/a\nnot indexed  /volume2/media\n"},
        Question{"WhyIndexed",
                 {"query", "--why", "/photos/2016", "/volume2/media/films"},
                 kDone,
                 "indexed  /photos/2016\n"
                 "  by /photos, for photo\n"
                 "indexed  /volume2/media/films\n"
                 "  by /media/films, for document,video\n"},
        Question{"WhyNotIndexed",
                 {"query", "--why", "/media"},
                 kNotFound,
                 "not indexed  /media\n"
                 "  not in any indexed folder\n"},
        Question{"WhyNotWithAFinalSlash",
                 {"query", "--why", "/photos/"},
                 kNotFound,
                 "not indexed  /photos/\n"
                 "  not by /photos, because of the trailing slash\n"
                 "  nor could it be: its path has symbolic links or the like; the real path is "
                 "/volume1/photos\n"},
        Question{"WhyReservedName",
                 {"query", "--why", "/photos/@eaDir/x"},
                 kDone,
                 "indexed  /photos/@eaDir/x\n"
                 "  by /photos, for photo\n"
                 "  but left out: a name in its path is reserved by the system\n"},
        Question{"WhyMissing",
                 {"query", "--why", "/photos/nix"},
                 kDone,
                 "indexed  /photos/nix\n"
                 "  by /photos, for photo\n"
                 "  but left out: there is nothing at /volume1/photos/nix\n"},
        Question{"WhyFullPath",
                 {"query", "--why", "--full-path", "/volume1/photos/2016", "/etc"},
                 kNotFound,
                 "indexed  /volume1/photos/2016\n"
                 "  by /photos, for photo\n"
                 "not indexed  /etc\n"
                 "  not in any indexed folder\n"
                 "  nor could it be: it lies in no share\n"},
        Question{"WhyShare",
                 {"query", "--why", "--share", "photos", "music"},
                 kNotFound,
                 "indexed  photos\n"
                 "  by /photos\n"
                 "not indexed  music\n"
                 "  it has no indexed folder\n"},
        Question{"WhyAsJson",
                 {"query", "--why", "--json", "/photos/@eaDir", "/media"},
                 kNotFound,
                 R"({"query":[{"asked":"/photos/@eaDir","indexed":true,"refusal":)"
                 R"({"fix":"Use another name.","rule":"reserved-name",)"
                 R"("why":"a name in its path is reserved by the system"},"setting":)"
                 R"({"audio":false,"document":false,"name":"Photos","path":"/photos",)"
                 R"("photo":true,"video":false}},{"asked":"/media","indexed":false,)"
                 R"("refusal":null,"setting":null}]})"
                 "\n"},
        Question{"OtherFullPath",
                 {"query", "--full-path", "/photos"},
                 kNotFound,
                 "not indexed  /photos\n"},
        Question{"Shares",
                 {"query", "--share", "photos", "media"},
                 kDone,
                 "indexed  photos\nindexed  media\n"},
        Question{"OtherShare", {"query", "--share", "music"}, kNotFound, "not indexed  music\n"},
        Question{"Json",
                 {"query", "--json", "/photos", "/x"},
                 kNotFound,
                 R"({"query":[{"asked":"/photos","indexed":true},{"asked":"/x","indexed":false}]})"
                 "\n"}),
    [](const auto &row) { return row.param.what; });

TEST_F(CtlTest, QueryOfBrokenSettingsIsNoAnswer) {
    Save("{");
    for (const Words &arguments :
         {Words{"query", "/photos"}, Words{"query", "--share", "photos"}}) {
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_EQ(outcome.out, "");
        EXPECT_THAT(outcome.error, HasSubstr("Cannot tell what is indexed"));
    }
}

TEST_F(CtlTest, QueryWhySaysThatAFileIsOfAnotherType) {
    Save(kPhotos);
    for (const char *name : {"a.JPG", "a.txt", "a", ".jpg", "a.raw b"}) {
        PutFile(std::string("/volume1/photos/") + name, "");
    }
    MakeDirs("/volume1/photos/b.txt");
    const std::pair<const char *, const char *> rows[] = {
        {"/photos/a.JPG", ""},
        {"/photos/b.txt", ""},
        {"/photos/a.txt", "  but left out: by its name, the file is of type document\n"},
        {"/photos/a", "  but left out: by its name, the file is of none of the four types\n"},
        {"/photos/.jpg", "  but left out: by its name, the file is of none of the four types\n"},
        {"/photos/a.raw b", "  but left out: by its name, the file is of none of the four types\n"},
    };
    for (const auto &[path, line] : rows) {
        EXPECT_EQ(Ctl({"query", "--why", path}).out,
                  std::string("indexed  ") + path + "\n  by /photos, for photo\n" + line);
    }
    EXPECT_EQ(
        Json(Ctl({"query", "--why", "--json", "/photos/a.txt"}).out)["query"][0]["refusal"]["rule"],
        "file-type");
}

TEST_F(CtlTest, QueryWhyNamesTheSettingOfAShareThatIsGone) {
    Save(R"({"/gone":{"photo":true},"/gone/x":{}})");
    EXPECT_EQ(Ctl({"query", "--why", "/gone/x/y"}).out, "indexed  /gone/x/y\n"
                                                        "  by /gone/x, for no file types\n"
                                                        "  but left out: no share has that name\n");
}

TEST_F(CtlTest, QueryWhyNamesTheDeepestFolder) {
    Save(R"({"/photos":{"photo":true},"/photos/2016":{"audio":true}})");
    EXPECT_EQ(Ctl({"query", "--why", "/photos/2016"}).out, "indexed  /photos/2016\n"
                                                           "  by /photos/2016, for audio\n");
}

} // namespace
} // namespace VANO::TESTS
