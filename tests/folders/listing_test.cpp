// The settings page's listing: sorting, paging and the additional facts of each record.

#include "support/fixture.h"

#include <algorithm>
#include <climits>
#include <set>

#include <fileindex/folder.h>
#include <fileindex/folders.h>

namespace VANO::TESTS {

namespace {

using Names = std::vector<std::string>;

const std::string kStatus = "status";
const std::string kIsValid = "is_valid";

// Signed and unsigned numbers of one value are the same text, though not the same JSON value.
std::string TextOf(const Json::Value &value) {
    return value.toStyledString();
}

class ListingTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        MakeDirs("/volume1/photos/trip");
        EventTrace::Get().Clear();
    }

    Folder &Add(const std::string &path, const std::string &name = "") {
        Folder folder;
        folder.path = path;
        folder.full_path = "/volume1" + path;
        folder.name = name;
        return folders.folders[path] = folder;
    }

    // /photos/0 to /photos/<count - 1>; up to 10 of them also sort like that.
    void AddMany(int count) {
        for (int number = 0; number < count; ++number) {
            Add("/photos/" + std::to_string(number));
        }
    }

    Json::Value List(unsigned long offset, unsigned long limit, const std::string &sortBy = "",
                     const std::string &direction = "",
                     const Json::Value &additional = Json::Value(Json::arrayValue)) {
        Json::Value out("of an earlier call");
        EXPECT_TRUE(folders.List(out, offset, limit, sortBy, direction, additional));
        return out;
    }

    Json::Value Records(unsigned long offset, unsigned long limit, const std::string &sortBy = "",
                        const std::string &direction = "") {
        return List(offset, limit, sortBy, direction)["folder"];
    }

    // The last components of the page's paths.
    Names Page(unsigned long offset, unsigned long limit, const std::string &sortBy = "",
               const std::string &direction = "") {
        Names names;
        for (const Json::Value &record : Records(offset, limit, sortBy, direction)) {
            const std::string path = record["path"].asString();
            names.push_back(path.substr(path.rfind('/') + 1));
        }
        return names;
    }

    Folders folders;
};

// --- the page -------------------------------------------------------------------------------

TEST_F(ListingTest, WithoutRecordsThePageIsEmpty) {
    EXPECT_EQ(TextOf(List(7, 10, "name", "DESC")),
              TextOf(Json(R"({"total":0,"offset":7,"folder":[]})")));
    EXPECT_TRUE(List(0, 10)["folder"].isArray());
}

TEST_F(ListingTest, ARecordIsItsJsonWithTheAdditionalFacts) {
    Folder &folder = Add("/photos/trip", "Trip \"1\"");
    folder.audio = folder.photo = true;
    EXPECT_EQ(TextOf(List(0, 10)), TextOf(Json(R"({"total":1,"offset":0,"folder":[
        {"path":"/photos/trip","name":"Trip \"1\"","document":false,"audio":true,"video":false,
         "photo":true,"additional":{}}]})")));
    EXPECT_EQ(List(0, 10, "", "", Json(R"(["is_valid","status"])"))["folder"][0]["additional"],
              Json(R"({"is_valid":true,"status":"finished"})"));
}

TEST_F(ListingTest, TotalAndOffsetAreUnsigned) {
    AddMany(3);
    const Json::Value out = List(ULONG_MAX, 1);
    EXPECT_EQ(out["total"].type(), Json::uintValue);
    EXPECT_EQ(out["offset"].type(), Json::uintValue);
    EXPECT_EQ(out["total"].asUInt64(), 3U);
    EXPECT_EQ(out["offset"].asUInt64(), ULONG_MAX);
    EXPECT_THAT(out.getMemberNames(), ElementsAre("folder", "offset", "total"));
}

TEST_F(ListingTest, APageIsCutFromTheSortedRecords) {
    AddMany(10);
    const struct {
        unsigned long offset;
        unsigned long limit;
        Names ascending;
        Names descending; // the first records reversed: the offset only shortens it
    } kRows[] = {
        {0, 3, {"0", "1", "2"}, {"2", "1", "0"}},
        {5, 3, {"5", "6", "7"}, {"2", "1", "0"}},
        {8, 5, {"8", "9"}, {"1", "0"}},
        {9, 1, {"9"}, {"0"}},
        {9, ULONG_MAX, {"9"}, {"0"}},
        {0, 0, {}, {}},
        {4, 0, {}, {}},
        {10, 3, {}, {}},
        {11, 3, {}, {"2", "1", "0"}}, // beyond the end it does not even do that
        {ULONG_MAX, 2, {}, {"1", "0"}},
        {7, 3, {"7", "8", "9"}, {"2", "1", "0"}},
        {7, 4, {"7", "8", "9"}, {"2", "1", "0"}},
    };
    for (const auto &row : kRows) {
        EXPECT_EQ(Page(row.offset, row.limit), row.ascending) << row.offset << " " << row.limit;
        EXPECT_EQ(Page(row.offset, row.limit, "", "DESC"), row.descending)
            << row.offset << " " << row.limit;
        EXPECT_EQ(List(row.offset, row.limit)["total"], 10U);
        EXPECT_EQ(List(row.offset, row.limit)["offset"].asUInt64(), row.offset);
    }
}

TEST_F(ListingTest, APageMayHoldAllRecords) {
    AddMany(10);
    const Names all = {"0", "1", "2", "3", "4", "5", "6", "7", "8", "9"};
    for (const unsigned long limit : {10UL, 11UL, ULONG_MAX}) {
        EXPECT_EQ(Page(0, limit), all);
        EXPECT_EQ(Page(0, limit, "", "DESC"), Names(all.rbegin(), all.rend()));
    }
    EXPECT_EQ(Page(11, ULONG_MAX, "", "DESC"), Names(all.rbegin(), all.rend()));
    EXPECT_EQ(Page(ULONG_MAX, ULONG_MAX, "", "DESC"), Names(all.rbegin(), all.rend()));
}

TEST_F(ListingTest, OnlyCapitalDescDescends) {
    AddMany(3);
    for (const char *direction :
         {"", "ASC", "desc", "Desc", "DESC ", " DESC", "DES", "DESCENDING"}) {
        EXPECT_THAT(Page(0, 10, "", direction), ElementsAre("0", "1", "2")) << direction;
    }
    EXPECT_THAT(Page(0, 10, "", "DESC"), ElementsAre("2", "1", "0"));
}

TEST_F(ListingTest, ListingReadsNoFileAndTakesNoLock) {
    AddMany(3);
    const HoldLock lock(kFolderLock);
    Fault::Count(Call::Open);
    EXPECT_EQ(Page(0, 10).size(), 3U);
    EXPECT_EQ(Fault::Calls(Call::Open), 0U);
    EXPECT_THAT(Effects(), IsEmpty());
    EXPECT_EQ(folders.folders.size(), 3U);
}

TEST_F(ListingTest, WhatWasLoadedIsListed) {
    PutFile(kFolderFile, R"({"/photos/b":{"name":"B","video":true},"/photos/a":{"name":"A"}})");
    ASSERT_TRUE(folders.Load());
    EXPECT_THAT(Page(0, 10), ElementsAre("a", "b"));
    EXPECT_EQ(List(1, 1)["folder"][0]["video"], Json::Value(true));
}

// --- sorting --------------------------------------------------------------------------------

TEST_F(ListingTest, SortsByNameWithoutRegardToCase) {
    Add("/photos/1", "delta");
    Add("/photos/2", "Charlie");
    Add("/photos/3", "bravo");
    Add("/photos/4", "ALPHA");
    EXPECT_THAT(Page(0, 10, "name"), ElementsAre("4", "3", "2", "1"));
    EXPECT_THAT(Page(0, 10, "name", "DESC"), ElementsAre("1", "2", "3", "4"));
    EXPECT_THAT(Page(1, 2, "name"), ElementsAre("3", "2"));
    EXPECT_THAT(Page(1, 2, "name", "DESC"), ElementsAre("3", "4"));
}

TEST_F(ListingTest, AnythingElseSortsByPathWithoutRegardToCase) {
    Add("/photos/d", "1");
    Add("/Photos/C", "2");
    Add("/photos/b", "3");
    Add("/PHOTOS/a", "4");
    for (const char *sortBy :
         {"path", "", "Name", "name ", "DOCUMENT", "is_valid", "full_path", "\xff"}) {
        EXPECT_THAT(Page(0, 10, sortBy), ElementsAre("a", "b", "C", "d")) << sortBy;
        EXPECT_THAT(Page(0, 10, sortBy, "DESC"), ElementsAre("d", "C", "b", "a")) << sortBy;
    }
}

TEST_F(ListingTest, ThePlatformComparesTheTexts) {
    Add("/photos/a", "one");
    Add("/photos/b", "two");
    // Upside down.
    platform.On("VLIBCUnicodeUTF8StrCaseCmp", [](const std::string &entry) -> std::optional<int> {
        const std::size_t comma = entry.find(", ");
        const std::size_t begin = entry.find('(') + 1;
        const std::string a = entry.substr(begin, comma - begin);
        const std::string b = entry.substr(comma + 2, entry.size() - comma - 3);
        return b.compare(a);
    });
    EXPECT_THAT(Page(0, 10, "name"), ElementsAre("b", "a"));
    EXPECT_THAT(Page(0, 10, "path"), ElementsAre("b", "a"));
    EXPECT_THAT(Page(0, 10, "video"), UnorderedElementsAre("a", "b"));
}

TEST_F(ListingTest, SortsRecordsWithoutAFileTypeFirst) {
    const struct {
        const char *sortBy;
        bool Folder::*flag;
    } kRows[] = {{"document", &Folder::document},
                 {"audio", &Folder::audio},
                 {"video", &Folder::video},
                 {"photo", &Folder::photo}};
    for (const auto &row : kRows) {
        folders.folders.clear();
        AddMany(40);
        for (int number = 0; number < 40; number += 2) {
            Folder &folder = folders.folders["/photos/" + std::to_string(number)];
            // Every other type is set the other way round.
            folder.document = folder.audio = folder.video = folder.photo = false;
            folder.*row.flag = true;
            Folder &next = folders.folders["/photos/" + std::to_string(number + 1)];
            next.document = next.audio = next.video = next.photo = true;
            next.*row.flag = false;
        }
        std::vector<bool> flags;
        std::set<std::string> paths;
        for (const Json::Value &record : Records(0, 100, row.sortBy)) {
            flags.push_back(record[row.sortBy].asBool());
            paths.insert(record["path"].asString());
        }
        EXPECT_TRUE(std::is_sorted(flags.begin(), flags.end())) << row.sortBy;
        EXPECT_EQ(std::count(flags.begin(), flags.end(), true), 20) << row.sortBy;
        EXPECT_EQ(paths.size(), 40U) << row.sortBy;
        EXPECT_FALSE(Records(0, 20, row.sortBy, "DESC")[0][row.sortBy].asBool());
        EXPECT_TRUE(Records(0, 40, row.sortBy, "DESC")[0][row.sortBy].asBool());
    }
    EXPECT_EQ(platform.Calls("VLIBCUnicodeUTF8StrCaseCmp"), 0U);
}

TEST_F(ListingTest, EqualTextsLoseNoRecord) {
    AddMany(300);
    platform.AnswerAlways("VLIBCUnicodeUTF8StrCaseCmp", 0);
    for (const char *sortBy : {"name", "path", "audio"}) {
        const Names page = Page(0, 300, sortBy);
        EXPECT_EQ(std::set<std::string>(page.begin(), page.end()).size(), 300U) << sortBy;
    }
}

TEST_F(ListingTest, AThousandRecordsAreSorted) {
    for (int number = 0; number < 1000; ++number) {
        const std::string digits = std::to_string(number * 7919 % 1000 + 1000);
        Add("/photos/" + std::to_string(number), (number % 2 == 0 ? "N" : "n") + digits);
    }
    Names names;
    for (const Json::Value &record : Records(0, 1000, "name")) {
        names.push_back(record["name"].asString().substr(1));
    }
    ASSERT_EQ(names.size(), 1000U);
    EXPECT_TRUE(std::is_sorted(names.begin(), names.end()));
    EXPECT_EQ(names.front(), "1000");
    EXPECT_EQ(names.back(), "1999");
}

// --- one additional fact --------------------------------------------------------------------

TEST_F(ListingTest, StatusIsTheFoldersProgress) {
    const Folder folder = Add("/photos/trip");
    Json::Value out;
    EXPECT_TRUE(folder.GetAdditional(out, kStatus));
    EXPECT_EQ(out, Json::Value("finished"));
    PutFile("/volume1/photos/@eaDir/VANO@file_index_queue",
            R"({"event":1,"path":"/volume1/photos/trip/a"})");
    EXPECT_TRUE(folder.GetAdditional(out, kStatus));
    EXPECT_EQ(out, Json::Value("processing"));
    PutFile(kStatusFile, R"({"no_space":{"photos":true}})");
    EXPECT_TRUE(folder.GetAdditional(out, kStatus));
    EXPECT_EQ(out, Json::Value("err_no_space"));
    platform.FindShare("photos")->readOnly = true;
    EXPECT_TRUE(folder.GetAdditional(out, kStatus));
    EXPECT_EQ(out, Json::Value("paused"));
}

TEST_F(ListingTest, IsValidTellsWhetherTheFolderCanBeIndexed) {
    const Folder folder = Add("/photos/trip");
    Json::Value out;
    EXPECT_TRUE(folder.GetAdditional(out, kIsValid));
    EXPECT_EQ(out, Json::Value(true));
    platform.FindShare("photos")->readOnly = true;
    EXPECT_TRUE(folder.GetAdditional(out, kIsValid));
    EXPECT_EQ(out, Json::Value(false));
    platform.RemoveShare("photos");
    EXPECT_TRUE(folder.GetAdditional(out, kIsValid));
    EXPECT_EQ(out, Json::Value(false));
    ExpectLog({"utils:191 GetFullPath failed, path=/photos/trip"});
}

TEST_F(ListingTest, AFactThatIsFoundKeepsTheLastError) {
    const Folder folder = Add("/photos/trip");
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    EXPECT_EQ(folder.asJson(Json(R"(["status","is_valid"])"))["additional"],
              Json(R"({"status":"finished","is_valid":true})"));
    ExpectError(FILEINDEX_ERR_SAVE);
}

TEST_F(ListingTest, AnUnknownFactLeavesTheOutputAlone) {
    const Folder folder = Add("/photos/trip");
    for (const std::string key : {"Status", "STATUS", "status ", "valid", "", "path", "%s"}) {
        Json::Value out("kept");
        EXPECT_FALSE(folder.GetAdditional(out, key)) << key;
        EXPECT_EQ(out, Json::Value("kept"));
        ExpectLog({"folder:129 Unknown additional: " + key});
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
    }
}

// --- a list of facts ------------------------------------------------------------------------

TEST_F(ListingTest, AListOfFactsIsAnObject) {
    const Folder folder = Add("/photos/trip");
    const struct {
        const char *keys;
        const char *facts;
    } kRows[] = {
        {R"([])", R"({})"},
        {R"(["status"])", R"({"status":"finished"})"},
        {R"(["is_valid","status"])", R"({"is_valid":true,"status":"finished"})"},
        {R"(["is_valid","is_valid"])", R"({"is_valid":true})"},
    };
    for (const auto &row : kRows) {
        Json::Value out("of an earlier call");
        EXPECT_TRUE(folder.GetAdditional(out, Json(row.keys))) << row.keys;
        EXPECT_EQ(out, Json(row.facts)) << row.keys;
        EXPECT_TRUE(out.isObject());
        ExpectLog({});
        ExpectError(FILEINDEX_ERR_NONE);
    }
}

TEST_F(ListingTest, TheListMayLieWhereTheFactsGo) {
    const Folder folder = Add("/photos/trip");
    Json::Value value = Json(R"(["is_valid","status"])");
    EXPECT_TRUE(folder.GetAdditional(value, value));
    EXPECT_EQ(value, Json(R"({"is_valid":true,"status":"finished"})"));
    value = Json(R"({"keys":["is_valid"]})");
    EXPECT_TRUE(folder.GetAdditional(value, value["keys"]));
    EXPECT_EQ(value, Json(R"({"is_valid":true})"));
    value = Json(R"(["is_valid"])");
    EXPECT_TRUE(folders.List(value, 0, 10, "", "", value));
    EXPECT_EQ(value["folder"][0]["additional"], Json(R"({"is_valid":true})"));
}

TEST_F(ListingTest, AnUnknownFactLeavesANullMember) {
    const Folder folder = Add("/photos/trip");
    Json::Value out;
    EXPECT_TRUE(folder.GetAdditional(out, Json(R"(["status","unknown","is_valid",""])")));
    EXPECT_EQ(out, Json(R"({"status":"finished","unknown":null,"is_valid":true,"":null})"));
    ExpectLog({"folder:129 Unknown additional: unknown",
               "folder:110 Failed to get additional: unknown",
               "folder:129 Unknown additional: ", "folder:110 Failed to get additional: "});
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
}

TEST_F(ListingTest, AnElementThatIsNoStringEndsTheList) {
    const Folder folder = Add("/photos/trip");
    for (const std::string element :
         {"5", "null", "true", "[]", R"({"a":[1,2]})", R"(["status"])"}) {
        Json::Value out;
        EXPECT_FALSE(
            folder.GetAdditional(out, Json(R"(["status",)" + element + R"(,"is_valid"])")));
        EXPECT_EQ(out, Json(R"({"status":"finished"})")) << element;
        ExpectLog({"folder:104 Bad param: " + element});
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
    }
}

TEST_F(ListingTest, AHoleInTheListIsNoString) {
    const Folder folder = Add("/photos/trip");
    Json::Value keys(Json::arrayValue);
    keys[1] = "status";
    Json::Value out;
    EXPECT_FALSE(folder.GetAdditional(out, keys));
    EXPECT_EQ(out, Json("{}"));
    ExpectLog({"folder:104 Bad param: null"});
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
}

TEST_F(ListingTest, WhatIsNoListIsABadParameter) {
    const Folder folder = Add("/photos/trip");
    for (const std::string keys :
         {"null", "{}", "5", "true", R"("status")", R"({"status":[1,"x"]})"}) {
        Json::Value out("of an earlier call");
        EXPECT_FALSE(folder.GetAdditional(out, Json(keys)));
        EXPECT_EQ(out, Json("{}")) << keys;
        EXPECT_TRUE(out.isObject()) << keys;
        ExpectLog({"folder:97 Bad param: " + keys});
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
    }
}

TEST_F(ListingTest, TheJsonHasAnAdditionalObjectInAnyCase) {
    const Folder folder = Add("/photos/trip", "Trip");
    Json::Value expected = folder.asJson();
    expected["additional"] = Json("{}");
    EXPECT_EQ(folder.asJson(Json("[]")), expected);
    ExpectLog({});
    EXPECT_EQ(folder.asJson(Json::Value()), expected);
    ExpectLog({"folder:97 Bad param: null", "folder:83 GetAdditional failed"});
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    expected["additional"] = Json(R"({"is_valid":true})");
    EXPECT_EQ(folder.asJson(Json(R"(["is_valid",7,"status"])")), expected);
    ExpectLog({"folder:104 Bad param: 7", "folder:83 GetAdditional failed"});
    expected["additional"] = Json(R"({"unknown":null})");
    EXPECT_EQ(folder.asJson(Json(R"(["unknown"])")), expected);
    ExpectLog(
        {"folder:129 Unknown additional: unknown", "folder:110 Failed to get additional: unknown"});
}

TEST_F(ListingTest, ABadListIsLoggedOncePerListedRecord) {
    AddMany(10);
    const Json::Value out = List(0, 2, "", "", Json::Value());
    EXPECT_EQ(out["folder"].size(), 2U);
    EXPECT_EQ(out["folder"][1]["additional"], Json("{}"));
    ExpectLog({"folder:97 Bad param: null", "folder:83 GetAdditional failed",
               "folder:97 Bad param: null", "folder:83 GetAdditional failed"});
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    EXPECT_EQ(List(0, 0, "", "", Json::Value())["folder"].size(), 0U);
    ExpectLog({});
}

TEST_F(ListingTest, FactsAreAskedInTheOrderOfThePage) {
    for (const char *name : {"a", "b", "c"}) {
        MakeDirs(std::string("/volume1/photos/") + name);
        Add(std::string("/photos/") + name);
    }
    (void)List(0, 2, "", "DESC", Json(R"(["is_valid"])"));
    std::vector<std::string> asked;
    for (const std::string &entry : platform.Trace()) {
        if (entry.rfind("VANOGetFSType(", 0) == 0) {
            asked.push_back(entry);
        }
    }
    EXPECT_THAT(asked, ElementsAre("VANOGetFSType(/volume1/photos/b, 0)",
                                   "VANOGetFSType(/volume1/photos/a, 0)"));
}

// --- the facts of a whole page ------------------------------------------------------------------

class PageStatusTest : public ListingTest {
  protected:
    void SetUp() override {
        ListingTest::SetUp();
        for (const char *name : {"a", "a/inside", "b", "c"}) {
            MakeDirs(std::string("/volume1/photos/") + name);
            Add(std::string("/photos/") + name);
        }
    }

    // The status of a, a/inside, b and c.
    Names Statuses() {
        Names statuses;
        const Json::Value page = List(0, 10, "path", "", Json(R"(["status"])"));
        for (const Json::Value &record : page["folder"]) {
            statuses.push_back(record["additional"]["status"].asString());
        }
        return statuses;
    }

    static std::string Event(const std::string &path) {
        return R"({"event":1,"path":"/volume1/photos/)" + path + "\"}\n";
    }

    static std::size_t TimesOpened(const std::string &file) {
        const auto &opens = Fault::Log(Call::Open);
        return static_cast<std::size_t>(std::count_if(
            opens.begin(), opens.end(), [&](const CallInfo &call) { return call.path == file; }));
    }

    const std::string queue = "/volume1/photos/@eaDir/VANO@file_index_queue";
    const std::string malformed = "status_mgr:47 Malformed command: ";
};

TEST_F(PageStatusTest, EachFolderHasItsOwnStatus) {
    PutFile(queue, Event("a/inside/x") + Event("bb"));
    PutFile(queue + ".tmp",
            R"({"event":256,"path":"/volume2/x","path_old":"/volume1/photos/c/x"})");
    EXPECT_THAT(Statuses(), ElementsAre("processing", "processing", "finished", "processing"));
    ExpectLog({});
}

TEST_F(PageStatusTest, FoldersOfOneShareShareTheScans) {
    PutFile(queue, Event("a/x"));
    PutFile(queue + ".tmp", "");
    Fault::Count(Call::Open);
    (void)Statuses();
    EXPECT_EQ(TimesOpened(queue), 1U);
    EXPECT_EQ(TimesOpened(queue + ".tmp"), 1U);
}

TEST_F(PageStatusTest, AMalformedLineIsLoggedForEachFolder) {
    PutFile(queue, "x\n" + Event("b"));
    PutFile(queue + ".tmp", "y\n");
    EXPECT_THAT(Statuses(), ElementsAre("finished", "finished", "processing", "finished"));
    // What waits in the queue itself is not looked for behind it.
    ExpectLog({malformed + "x", malformed + "y", malformed + "x", malformed + "y", malformed + "x",
               malformed + "x", malformed + "y"});
}

TEST_F(PageStatusTest, AQueueThatCannotBeOpenedIsLoggedForEachFolder) {
    PutFile(queue, Event("a"));
    Fault::FailPath(Call::Open, queue, EACCES);
    EXPECT_THAT(Statuses(), ElementsAre("finished", "finished", "finished", "finished"));
    const std::string line =
        "status_mgr:37 Failed to open queue=" + queue + ", reason=Permission denied";
    ExpectLog({line, line, line, line});
}

// Its folder has no full path, which is no folder to scan for.
TEST_F(PageStatusTest, AFolderOfAGoneShareChangesNothingForTheOthers) {
    platform.AddShare("gone", "/volume1/gone");
    MakeDirs("/volume1/gone/x");
    Add("/gone/x");
    platform.RemoveShare("gone");
    PutFile(queue, Event("a/inside/x"));
    Fault::Count(Call::Open);
    EXPECT_THAT(Statuses(),
                ElementsAre("paused", "processing", "processing", "finished", "finished"));
    EXPECT_EQ(TimesOpened(queue), 1U);
    ExpectLog({"utils:191 GetFullPath failed, path=/gone/x"});
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
}

TEST_F(PageStatusTest, NothingIsKeptForTheNextPage) {
    PutFile(queue, Event("a"));
    EXPECT_THAT(Statuses(), ElementsAre("processing", "finished", "finished", "finished"));
    PutFile(queue, Event("b"));
    EXPECT_THAT(Statuses(), ElementsAre("finished", "finished", "processing", "finished"));
}

} // namespace

} // namespace VANO::TESTS
