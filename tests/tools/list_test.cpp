#include <algorithm>
#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::StartsWith;

TEST_F(CtlTest, ListOfNothingIsDone) {
    const Outcome outcome = Ctl({"list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: No folder is indexed.\n"
                             "  fileindexctl add indexes a folder.\n");
}

TEST_F(CtlTest, ListAlignsItsLines) {
    Save(kTwo);
    const Outcome outcome = Ctl({"list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "/media/films  -       document,video  finished\n"
                           "/photos       Photos  photo           finished\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(CtlTest, ListOfAShareShowsNoOther) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"list", "--share", "photos"}).out, "/photos  Photos  photo  finished\n");
    const Outcome none = Ctl({"list", "--share", "photo"});
    EXPECT_EQ(none.status, kNotFound);
    EXPECT_EQ(none.out, "");
    EXPECT_EQ(none.error, "fileindexctl: No folder of share photo is indexed.\n");
}

TEST_F(CtlTest, ListAsJsonIsOneCompactObject) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"list", "--json"}).out,
              R"({"folder":[{"additional":{"is_valid":true,"status":"finished"},"audio":false,)"
              R"("document":false,"name":"Photos","path":"/photos","photo":true,"video":false}],)"
              R"("offset":0,"total":1})"
              "\n");
}

TEST_F(CtlTest, ListTellsWhatKeepsAFolderFromBeingIndexed) {
    Save(kTwo);
    RemoveTree("/volume2/media/films");
    PutFile(kStatus, R"({"no_space":{"photos":true}})");
    EXPECT_EQ(Ctl({"list"}).out, "/media/films  -       document,video  cannot be indexed\n"
                                 "/photos       Photos  photo           out of space\n");
}

TEST_F(CtlTest, ListShowsWhatWaits) {
    Save(kPhotos);
    PutFile(kPhotoQueue, R"({"data":null,"event":65536,"path":"/volume1/photos"})"
                         "\n");
    EXPECT_THAT(Ctl({"list"}).out, HasSubstr("processing"));
    PutFile(kStatus, R"({"resume_time":0})");
    EXPECT_THAT(Ctl({"list"}).out, HasSubstr("paused"));
}

TEST_F(CtlTest, NamesCannotPlayTricksOnTheTerminal) {
    Save("{\"/photos\":{\"name\":\"a\\n\\u001b[31m\\u202e\\\\\xff\",\"photo\":true}}");
    EXPECT_EQ(Ctl({"list"}).out, "/photos  a\\n\\x1b[31m\\u202e\\\\\\xff  photo  finished\n");
    EXPECT_THAT(Ctl({"show", "/photos"}).out, HasSubstr("a\\n\\x1b[31m\\u202e\\\\\\xff\n"));
    EXPECT_THAT(Ctl({"list", "--json"}).out, HasSubstr("\xff")); // byte for byte
    EXPECT_THAT(Ctl({"show", "/a\x1b[31m"}).error, HasSubstr("/a\\x1b[31m is not set"));
}

TEST_F(CtlTest, WideAndCombiningCharactersStayAligned) {
    MakeDirs("/volume1/photos/e");
    Save(R"({"/photos":{"name":"日本","photo":true},"/photos/2016":{"name":"abcd","photo":true},)"
         "\"/photos/e\":{\"name\":\"e\xCC\x81t\xC3\xA9s\",\"photo\":true}}");
    EXPECT_EQ(Ctl({"list"}).out, "/photos       日本  photo  finished\n"
                                 "/photos/2016  abcd  photo  finished\n"
                                 "/photos/e     e\xCC\x81t\xC3\xA9s  photo  finished\n");
}

TEST_F(CtlTest, ListOfBrokenSettingsFails) {
    for (const char *broken : {"{", "[]", ""}) {
        Save(broken);
        const Outcome outcome = Ctl({"list"});
        EXPECT_EQ(outcome.status, kFailed) << broken;
        EXPECT_EQ(outcome.out, "") << broken;
        EXPECT_THAT(outcome.error, AllOf(StartsWith("fileindexctl: Cannot list the folders: a "
                                                    "settings file "),
                                         HasSubstr("fileindexctl doctor settings")))
            << broken;
    }
}

constexpr char kThree[] =
    R"({"/media":{"name":"b","audio":true},"/photos/2016":{"name":"C","photo":true},)"
    R"("/photos/x":{"name":"A","photo":true}})";

std::string Paths(const Words &options) {
    Words arguments = {"list", "--null"};
    arguments.insert(arguments.end(), options.begin(), options.end());
    std::string paths = Ctl(arguments).out;
    std::replace(paths.begin(), paths.end(), '\0', ' ');
    return paths;
}

TEST_F(CtlTest, ListSortsAndTurnsRound) {
    Save(kThree);
    EXPECT_EQ(Paths({}), "/media /photos/2016 /photos/x ");
    EXPECT_EQ(Paths({"--desc"}), "/photos/x /photos/2016 /media ");
    EXPECT_EQ(Paths({"--sort", "name"}), "/photos/x /media /photos/2016 ");
    EXPECT_EQ(Paths({"--sort=name", "--desc"}), "/photos/2016 /media /photos/x ");
    EXPECT_EQ(Paths({"--sort", "audio", "--desc", "--limit", "1"}), "/media ");
}

TEST_F(CtlTest, ListPagesInEitherDirection) {
    Save(kThree);
    EXPECT_EQ(Paths({"--offset", "1", "--limit", "1"}), "/photos/2016 ");
    EXPECT_EQ(Paths({"--offset", "1"}), "/photos/2016 /photos/x ");
    EXPECT_EQ(Paths({"--desc", "--offset", "2"}), "/media ");
    EXPECT_EQ(Paths({"--offset", "3"}), "");
    EXPECT_EQ(Paths({"--limit", "0"}), "");
    EXPECT_EQ(Paths({"--share", "photos", "--offset", "1"}), "/photos/x ");
}

TEST_F(CtlTest, ListSaysWhatItLeavesOut) {
    Save(kThree);
    EXPECT_EQ(Ctl({"list", "--limit", "2"}).error, "fileindexctl: Shown 2 of 3.\n");
    const Json::Value page = Json(Ctl({"list", "--offset", "2", "--json"}).out);
    EXPECT_EQ(page["total"].asInt(), 3);
    EXPECT_EQ(page["offset"].asInt(), 2);
    EXPECT_EQ(page["folder"].size(), 1U);
}

TEST_F(CtlTest, ListAsPrettyJsonIsIndented) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"list", "--json=pretty"}).out, R"({
  "folder": [
    {
      "additional": {
        "is_valid": true,
        "status": "finished"
      },
      "audio": false,
      "document": false,
      "name": "Photos",
      "path": "/photos",
      "photo": true,
      "video": false
    }
  ],
  "offset": 0,
  "total": 1
}
)");
    EXPECT_EQ(Ctl({"list", "--json=off"}).out, Ctl({"list"}).out);
    EXPECT_EQ(Ctl({"list", "-j"}).out, Ctl({"list", "--json=short"}).out); // off a terminal
}

TEST_F(CtlTest, PrettyJsonLeavesNamesAlone) {
    Save(R"({"/photos":{"name":"a: \n  [ \": {","photo":true}})");
    for (const char *form : {"--json=short", "--json=pretty"}) {
        EXPECT_EQ(Json(Ctl({"list", form}).out)["folder"][0]["name"].asString(), "a: \n  [ \": {");
    }
}

TEST_F(CtlTest, JsonHoldsNamesThatAreNotUtf8ByteForByte) {
    const std::string path = "/photos/\xff\xfe\x01";
    Save("{\""
         "/photos/\xff\xfe\\u0001"
         "\":{\"photo\":true}}");
    for (const char *form : {"--json=short", "--json=pretty"}) {
        EXPECT_EQ(Json(Ctl({"list", form}).out)["folder"][0]["path"].asString(), path);
    }
    EXPECT_EQ(Paths({}), path + " ");
}

} // namespace
} // namespace VANO::TESTS
