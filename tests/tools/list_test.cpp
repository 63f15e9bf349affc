#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, ListOfNothingIsDone) {
    const Outcome outcome = Ctl({"list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: No folder is indexed.\n"
                             "  Use fileindexctl add to index one.\n");
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
              R"("document":false,"name":"Photos","path":"/photos","photo":true,"video":false}]})"
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
    EXPECT_THAT(Ctl({"show", "/a\x1b[31m"}).error,
                HasSubstr("/a\\x1b[31m is not an indexed folder"));
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

TEST_F(CtlTest, ListEndsEachPathInAZeroByte) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"list", "--null"}).out, std::string("/media/films\0/photos\0", 21));
    EXPECT_EQ(Ctl({"list", "--null", "--share", "photos"}).out, std::string("/photos\0", 8));
    EXPECT_EQ(Ctl({"list", "--null", "--share", "nix"}).status, kNotFound);
}

TEST_F(CtlTest, ListAsPrettyJsonIsIndented) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"list", "--json=pretty"}).out, R"({
  "folder": 
  [
    {
      "additional": 
      {
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
  ]
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
    EXPECT_EQ(Ctl({"list", "--null"}).out, path + '\0');
}

} // namespace
} // namespace VANO::TESTS
