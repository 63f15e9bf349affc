// The status file's operations on the document in memory, without StatusMgr's lock and commands.

#include "support/fixture.h"

#include <fileindex/status.h>
#include <json/json.h>

namespace VANO::TESTS {

namespace {

constexpr char kNotification[] =
    "VLIBCExecv(/usr/vano/bin/vanozemnotify, [/usr/vano/bin/vanozemnotify, -e, false, -c, "
    "VANO.KWX.AdminCenter.Application, @administrators, fileindex:fileindex_title, "
    "fileindex:notify_no_space, <a data-vano-app=\"VANO.KWX.AdminCenter.Application\" "
    "data-vano-fn=\"VANO.KWX.AdminCenter.MediaIndex.Main\" data-vano-tab=\"fileIndex\">, </a>], 1)";

class StatusTest : public LibraryTest {
  protected:
    Status status;
};

TEST_F(StatusTest, NamesItsTwoFiles) {
    EXPECT_EQ(status.GetPath(), kStatusFile);
    EXPECT_EQ(status.GetLockPath(), kStatusLock);
}

TEST_F(StatusTest, StartsAsAnEmptyObjectWithoutALock) {
    EXPECT_EQ(status.root, Json::Value(Json::objectValue));
    EXPECT_EQ(status.lock_fd, -1);
}

TEST_F(StatusTest, AMissingFileReadsAsNothingPausedMarkedOrDone) {
    long long resumeTime = 77;
    EXPECT_TRUE(status.Load());
    EXPECT_TRUE(status.GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, -1);
    EXPECT_FALSE(status.ShareIsNoSpace("photos"));
    EXPECT_FALSE(status.ShareIsNeedReindex("photos"));
    EXPECT_FALSE(status.IsUpdated("step"));
    EXPECT_EQ(status.root, Json::Value(Json::objectValue));
    EXPECT_FALSE(Exists(kStatusFile));
}

TEST_F(StatusTest, LoadsWhatTheFileHolds) {
    PutFile(kStatusFile, R"({"resume_time":0,"no_space":{"a":true},"need_reindex":{"b":true},
                             "step":true})");
    long long resumeTime = 77;
    EXPECT_TRUE(status.Load());
    EXPECT_TRUE(status.GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, 0);
    EXPECT_TRUE(status.ShareIsNoSpace("a"));
    EXPECT_FALSE(status.ShareIsNoSpace("b"));
    EXPECT_TRUE(status.ShareIsNeedReindex("b"));
    EXPECT_FALSE(status.ShareIsNeedReindex("a"));
    EXPECT_TRUE(status.IsUpdated("step"));
}

TEST_F(StatusTest, AnUnreadableFileFailsToLoad) {
    PutFile(kStatusFile, "{");
    EXPECT_FALSE(status.Load());
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf"});
}

TEST_F(StatusTest, SavesTheDocument) {
    status.root = Json(R"({"step":true})");
    EXPECT_TRUE(status.Save());
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"step":true})"));
    EXPECT_EQ(ModeOf(kStatusFile), 0644U);
}

TEST_F(StatusTest, AFailedSaveIsReported) {
    Fault::FailAlways(Call::Mkostemp, ENOSPC);
    EXPECT_FALSE(status.Save());
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to /usr/vano/etc/fileindex/status.conf"});
}

TEST_F(StatusTest, ChangesStayInMemoryUntilTheyAreSaved) {
    const std::string before = R"({"resume_time":5})";
    PutFile(kStatusFile, before);
    Fault::Count(Call::Flock);
    {
        Status changed;
        EXPECT_TRUE(changed.Load());
        EXPECT_TRUE(changed.Pause(0));
        EXPECT_TRUE(changed.ShareSetNoSpace("a", true));
        EXPECT_TRUE(changed.ShareSetNoSpace("b", false));
        EXPECT_TRUE(changed.ShareSetNeedReindex("a", true));
        EXPECT_TRUE(changed.SetUpdated("step"));
        EXPECT_TRUE(changed.Resume());
        EXPECT_EQ(ReadText(kStatusFile), before);
    }
    EXPECT_EQ(ReadText(kStatusFile), before) << "saved by the destructor";
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_FALSE(Exists(kStatusLock));
}

TEST_F(StatusTest, PauseStoresTheTimeAs64Bits) {
    for (const long long time :
         {0LL, 1LL, -7LL, 9223372036854775807LL, -9223372036854775807LL - 1}) {
        long long read = 77;
        EXPECT_TRUE(status.Pause(time));
        EXPECT_TRUE(status.root["resume_time"].isInt64()) << time;
        EXPECT_EQ(status.root["resume_time"].asInt64(), time);
        EXPECT_TRUE(status.GetPauseInfo(read));
        EXPECT_EQ(read, time);
    }
    EXPECT_EQ(status.root.getMemberNames(), std::vector<std::string>{"resume_time"});
}

TEST_F(StatusTest, ResumeStoresMinusOne) {
    (void)status.Pause(0);
    EXPECT_TRUE(status.Resume());
    EXPECT_EQ(status.root, Json(R"({"resume_time":-1})"));
    EXPECT_TRUE(status.root["resume_time"].isInt());
}

TEST_F(StatusTest, PauseInfoConvertsWhatTheJsonLibraryConverts) {
    const struct {
        const char *document;
        long long resumeTime;
    } kRows[] = {
        {R"({})", -1},
        {R"(null)", -1},
        {R"({"resume_time":-1})", -1},
        {R"({"resume_time":0})", 0},
        {R"({"resume_time":4294967297})", 4294967297},
        {R"({"resume_time":1700000000.75})", 1700000000},
        {R"({"resume_time":true})", 1},
        {R"({"resume_time":null})", 0},
    };
    for (const auto &row : kRows) {
        long long resumeTime = 77;
        status.root = Json(row.document);
        EXPECT_TRUE(status.GetPauseInfo(resumeTime)) << row.document;
        EXPECT_EQ(resumeTime, row.resumeTime) << row.document;
    }
}

TEST_F(StatusTest, PauseInfoOfAnotherShapeIsLoggedAndLeavesTheOutputAlone) {
    for (const char *document :
         {R"({"resume_time":"0"})", R"({"resume_time":{}})", R"({"resume_time":[1]})",
          R"({"resume_time":9223372036854775808})", R"({"resume_time":1e300})", R"([])", R"(5)",
          R"("text")", R"(true)"}) {
        long long resumeTime = 77;
        status.root = Json(document);
        EXPECT_FALSE(status.GetPauseInfo(resumeTime)) << document;
        EXPECT_EQ(resumeTime, 77) << document;
        ExpectLog({"status:66 json exception"});
        ExpectError(FILEINDEX_ERR_NONE);
    }
}

TEST_F(StatusTest, MarkingAShareKeepsTheOthers) {
    status.root = Json(R"({"resume_time":5,"no_space":{"a":true},"need_reindex":{"b":true}})");
    EXPECT_TRUE(status.ShareSetNoSpace("c", true));
    EXPECT_TRUE(status.ShareSetNeedReindex("d", true));
    EXPECT_EQ(status.root, Json(R"({"resume_time":5,"no_space":{"a":true,"c":true},
                                    "need_reindex":{"b":true,"d":true}})"));
}

TEST_F(StatusTest, TheFirstMarkMakesTheMember) {
    EXPECT_TRUE(status.ShareSetNoSpace("a", true));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"a":true}})"));
    EXPECT_TRUE(status.ShareSetNeedReindex("a", true));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"a":true},"need_reindex":{"a":true}})"));
}

TEST_F(StatusTest, UnmarkingRemovesOnlyThatShare) {
    status.root = Json(R"({"no_space":{"a":true,"b":true},"need_reindex":{"a":true,"b":true}})");
    EXPECT_TRUE(status.ShareSetNoSpace("a", false));
    EXPECT_TRUE(status.ShareSetNeedReindex("b", false));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"b":true},"need_reindex":{"a":true}})"));
}

TEST_F(StatusTest, UnmarkingTheLastShareLeavesAnEmptyMember) {
    status.root = Json(R"({"no_space":{"a":true},"need_reindex":{"a":true}})");
    EXPECT_TRUE(status.ShareSetNoSpace("a", false));
    EXPECT_TRUE(status.ShareSetNeedReindex("a", false));
    EXPECT_EQ(status.root, Json(R"({"no_space":{},"need_reindex":{}})"));
}

TEST_F(StatusTest, UnmarkingWhatWasNeverMarkedLeavesNoMember) {
    EXPECT_TRUE(status.ShareSetNoSpace("a", false));
    EXPECT_TRUE(status.ShareSetNeedReindex("a", false));
    EXPECT_EQ(status.root, Json(R"({})"));
    EXPECT_THAT(Effects(), IsEmpty());
}

TEST_F(StatusTest, UnmarkingAnUnknownShareSucceeds) {
    status.root = Json(R"({"no_space":{"b":true},"need_reindex":{"b":true}})");
    EXPECT_TRUE(status.ShareSetNoSpace("a", false));
    EXPECT_TRUE(status.ShareSetNeedReindex("a", false));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"b":true},"need_reindex":{"b":true}})"));
}

TEST_F(StatusTest, UnmarkingANameWithAZeroByteLeavesTheShorterOne) {
    const std::string longer("a\0b", 3);
    status.root = Json(R"({"no_space":{"a":true,"a\u0000b":true},"need_reindex":{"a":true}})");
    EXPECT_TRUE(status.ShareSetNoSpace(longer, false));
    EXPECT_TRUE(status.ShareSetNeedReindex(longer, false));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"a":true},"need_reindex":{"a":true}})"));
}

TEST_F(StatusTest, AMarkIsAPresentKeyWhateverItsValue) {
    for (const char *value : {"true", "false", "null", "0", "\"\"", "{}"}) {
        status.root = Json(std::string(R"({"no_space":{"a":)") + value +
                           R"(},"need_reindex":{"a":)" + value + "}}");
        EXPECT_TRUE(status.ShareIsNoSpace("a")) << value;
        EXPECT_TRUE(status.ShareIsNeedReindex("a")) << value;
        EXPECT_FALSE(status.ShareIsNoSpace("A")) << value;
        EXPECT_FALSE(status.ShareIsNeedReindex("")) << value;
    }
}

TEST_F(StatusTest, QueriesOfAnyShapeAnswerNo) {
    for (const char *document :
         {"null", "[]", "[1]", "5", "true", "\"text\"", R"({"no_space":5,"need_reindex":5})",
          R"({"no_space":["a"],"need_reindex":["a"]})", R"({"no_space":null,"need_reindex":null})",
          R"({"no_space":"a","need_reindex":"a"})"}) {
        status.root = Json(document);
        EXPECT_FALSE(status.ShareIsNoSpace("a")) << document;
        EXPECT_FALSE(status.ShareIsNeedReindex("a")) << document;
        EXPECT_FALSE(status.IsUpdated("a")) << document;
        EXPECT_EQ(status.root, Json(document)) << "changed by a query";
    }
}

TEST_F(StatusTest, NamesAreBytes) {
    for (const std::string share : {"", "a.b/c", "\xff\xfe", "\"quoted\"\n", "resume_time"}) {
        EXPECT_TRUE(status.ShareSetNeedReindex(share, true));
        EXPECT_TRUE(status.Save());
        Status loaded;
        EXPECT_TRUE(loaded.Load());
        EXPECT_TRUE(loaded.ShareIsNeedReindex(share)) << share;
        EXPECT_FALSE(loaded.ShareIsNeedReindex(share + "x")) << share;
    }
}

TEST_F(StatusTest, TheFirstMarkNotifiesTheAdministrators) {
    (void)status.ShareSetNoSpace("a", true);
    EXPECT_THAT(Effects(), ElementsAre(kNotification));
}

TEST_F(StatusTest, TheNotificationComesBeforeTheMark) {
    bool markedBefore = true;
    platform.Before("VLIBCExecv", [&] { markedBefore = status.ShareIsNoSpace("a"); });
    (void)status.ShareSetNoSpace("a", true);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 1U);
    EXPECT_FALSE(markedBefore);
    EXPECT_TRUE(status.ShareIsNoSpace("a"));
}

TEST_F(StatusTest, NotifiesOncePerShareUntilTheMarkIsCleared) {
    (void)status.ShareSetNoSpace("a", true);
    (void)status.ShareSetNoSpace("a", true);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 1U);
    (void)status.ShareSetNoSpace("b", true);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 2U);
    (void)status.ShareSetNoSpace("a", false);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 2U);
    (void)status.ShareSetNoSpace("a", true);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 3U);
    (void)status.ShareSetNoSpace("b", true);
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 3U);
}

TEST_F(StatusTest, AMarkOfAnotherValueCountsAsTold) {
    status.root = Json(R"({"no_space":{"a":false}})");
    EXPECT_TRUE(status.ShareSetNoSpace("a", true));
    EXPECT_THAT(Effects(), IsEmpty());
    EXPECT_EQ(status.root, Json(R"({"no_space":{"a":true}})"));
}

TEST_F(StatusTest, ANullMemberBecomesAnObject) {
    status.root = Json(R"({"no_space":null,"need_reindex":null})");
    EXPECT_TRUE(status.ShareSetNoSpace("a", true));
    EXPECT_TRUE(status.ShareSetNeedReindex("a", true));
    EXPECT_EQ(status.root, Json(R"({"no_space":{"a":true},"need_reindex":{"a":true}})"));
}

TEST_F(StatusTest, AFailedNotificationIsLoggedAndTheMarkIsSet) {
    for (const int result : {-1, 1, 127}) {
        platform.Answer("VLIBCExecv", {result});
        status.root = Json("{}");
        EXPECT_TRUE(status.ShareSetNoSpace("a", true));
        ExpectLog({"status:88 NotifyNoSpace failed"});
        ExpectError(FILEINDEX_ERR_NONE);
        EXPECT_TRUE(status.ShareIsNoSpace("a"));
    }
    // It was tried: not again.
    EXPECT_TRUE(status.ShareSetNoSpace("a", true));
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 3U);
}

TEST_F(StatusTest, AShareThatNeedsANewIndexIsNoNews) {
    (void)status.ShareSetNeedReindex("a", true);
    EXPECT_THAT(Effects(), IsEmpty());
}

TEST_F(StatusTest, MarkingInAnotherShapeThrows) {
    for (const char *document :
         {"[]", "5", R"({"no_space":5,"need_reindex":5})", R"({"no_space":"a","need_reindex":"a"})",
          R"({"no_space":["a"],"need_reindex":["a"]})",
          R"({"no_space":true,"need_reindex":true})"}) {
        status.root = Json(document);
        for (const bool mark : {true, false}) {
            EXPECT_THROW((void)status.ShareSetNoSpace("a", mark), Json::Exception) << document;
            EXPECT_THROW((void)status.ShareSetNeedReindex("a", mark), Json::Exception) << document;
        }
        EXPECT_EQ(status.root, Json(document));
    }
    EXPECT_THAT(Effects(), IsEmpty()) << "nobody is told of a mark that cannot be set";
}

TEST_F(StatusTest, WritingToADocumentOfAnotherShapeThrows) {
    for (const char *document : {"[]", "5", "\"text\"", "true"}) {
        status.root = Json(document);
        EXPECT_THROW((void)status.Pause(1), Json::Exception) << document;
        EXPECT_THROW((void)status.Resume(), Json::Exception) << document;
        EXPECT_THROW((void)status.SetUpdated("a"), Json::Exception) << document;
    }
}

TEST_F(StatusTest, ANullDocumentBecomesAnObject) {
    status.root = Json("null");
    EXPECT_TRUE(status.Pause(5));
    EXPECT_EQ(status.root, Json(R"({"resume_time":5})"));
}

TEST_F(StatusTest, AStepIsDoneWhenItsMarkConvertsToTrue) {
    const struct {
        const char *value;
        bool done;
    } kRows[] = {{"true", true}, {"false", false}, {"0", false},   {"1", true},  {"-1", true},
                 {"7", true},    {"null", false},  {"0.0", false}, {"0.5", true}};
    for (const auto &row : kRows) {
        status.root = Json(std::string(R"({"step":)") + row.value + "}");
        EXPECT_EQ(status.IsUpdated("step"), row.done) << row.value;
        EXPECT_FALSE(status.IsUpdated("other")) << row.value;
        EXPECT_FALSE(status.IsUpdated("Step")) << row.value;
    }
}

TEST_F(StatusTest, AStepMarkThatConvertsToNoBooleanThrows) {
    for (const char *value : {"\"true\"", "{}", "[true]"}) {
        status.root = Json(std::string(R"({"step":)") + value + "}");
        EXPECT_THROW((void)status.IsUpdated("step"), Json::Exception) << value;
    }
}

TEST_F(StatusTest, AStepStandsAtTheTopLevel) {
    status.root = Json(R"({"resume_time":5,"step":false})");
    EXPECT_TRUE(status.SetUpdated("step"));
    EXPECT_TRUE(status.SetUpdated("other"));
    EXPECT_EQ(status.root, Json(R"({"resume_time":5,"step":true,"other":true})"));
}

TEST_F(StatusTest, AStepNamedLikeAMemberOverwritesIt) {
    status.root = Json(R"({"resume_time":5,"no_space":{"a":true},"need_reindex":{"a":true}})");
    for (const char *key : {"resume_time", "no_space", "need_reindex"}) {
        EXPECT_TRUE(status.SetUpdated(key));
        EXPECT_TRUE(status.IsUpdated(key));
    }
    EXPECT_EQ(status.root, Json(R"({"resume_time":true,"no_space":true,"need_reindex":true})"));
    EXPECT_FALSE(status.ShareIsNoSpace("a"));
    EXPECT_FALSE(status.ShareIsNeedReindex("a"));
}

} // namespace

} // namespace VANO::TESTS
