// The binary interface of libfileindex, as callers have it compiled in: what a class is laid out
// like, in which slot a virtual function is, what a name returns that does not say so itself.
// Names, and the parameters that they are mangled with, are exports_test's.

#include <array>
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <json/value.h>
#include <link.h>
#include <map>
#include <string>
#include <type_traits>
#include <vector>

#include <fileindex/error_handler.h>
#include <fileindex/fileindex.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/status.h>
#include <fileindex/status_mgr.h>
#include <fileindex/utils.h>

namespace {

using namespace VANO::FILEINDEX;

// --- Enumerators, types -----------------------------------------------------------------------

static_assert(std::is_same_v<std::underlying_type_t<_tag_fileindex_err_>, int>);
static_assert(FILEINDEX_ERR_NONE == 0 && FILEINDEX_ERR_BAD_PARAM == 1 && FILEINDEX_ERR_PATH == 2 &&
              FILEINDEX_ERR_RESERVED == 3 && FILEINDEX_ERR_NO_SUCH_FOLDER == 4 &&
              FILEINDEX_ERR_FOLDER_LIMIT == 5 && FILEINDEX_ERR_LOAD == 6 &&
              FILEINDEX_ERR_SAVE == 7 && FILEINDEX_ERR_MALFORMED == 8 && FILEINDEX_ERR_LOCK == 9);
static_assert(std::is_same_v<decltype(LOG_LEVEL), int>);
static_assert(std::is_same_v<decltype(ErrorHandler::g_error_code), _tag_fileindex_err_>);

// --- Layout -----------------------------------------------------------------------------------

// Its member lies right behind the last byte that Base uses: padding does not hide a new member.
template <class Base>
struct Behind : Base {
    char first = 0;
};

template <class Object, class Member>
long Offset(const Object &object, const Member &member) {
    return reinterpret_cast<const char *>(&member) - reinterpret_cast<const char *>(&object);
}

constexpr long kPointer = sizeof(void *);
constexpr long kString = sizeof(std::string);
constexpr long kConfig = kPointer + sizeof(Json::Value) + sizeof(int);
constexpr long kConfigPadded = (kConfig + kPointer - 1) / kPointer * kPointer;

TEST(Layout, Folder) {
    const Behind<Folder> folder;
    EXPECT_EQ(Offset<Folder>(folder, folder.full_path), 0);
    EXPECT_EQ(Offset<Folder>(folder, folder.path), kString);
    EXPECT_EQ(Offset<Folder>(folder, folder.name), 2 * kString);
    EXPECT_EQ(Offset<Folder>(folder, folder.document), 3 * kString);
    EXPECT_EQ(Offset<Folder>(folder, folder.audio), 3 * kString + 1);
    EXPECT_EQ(Offset<Folder>(folder, folder.video), 3 * kString + 2);
    EXPECT_EQ(Offset<Folder>(folder, folder.photo), 3 * kString + 3);
    EXPECT_EQ(Offset<Folder>(folder, folder.first), 3 * kString + 4);
    static_assert(!std::is_polymorphic_v<Folder> && std::is_same_v<decltype(Folder::photo), bool>);
}

TEST(Layout, ConfigIsThePartOfItsHeirs) {
    const Behind<Status> status;
    EXPECT_EQ(Offset<Config>(status, status.root), kPointer);
    EXPECT_EQ(Offset<Config>(status, status.lock_fd), kConfig - static_cast<long>(sizeof(int)));
    EXPECT_EQ(Offset<Status>(status, static_cast<const Config &>(status)), 0);
    EXPECT_EQ(Offset<Status>(status, status.first), kConfig);
    static_assert(std::is_same_v<decltype(Config::root), Json::Value> &&
                  std::is_same_v<decltype(Config::lock_fd), int>);
}

TEST(Layout, Folders) {
    const Behind<Folders> folders;
    EXPECT_EQ(Offset<Folders>(folders, static_cast<const Config &>(folders)), 0);
    EXPECT_EQ(Offset<Folders>(folders, folders.folders), kConfigPadded);
    EXPECT_EQ(Offset<Folders>(folders, folders.first),
              kConfigPadded + static_cast<long>(sizeof(std::map<std::string, Folder>)));
    static_assert(std::is_same_v<decltype(Folders::folders), std::map<std::string, Folder>>);
}

// --- Virtual tables ---------------------------------------------------------------------------

void *Exported(const std::string &name) {
    return dlsym(RTLD_DEFAULT, name.c_str());
}

size_t SizeOf(const std::string &name) {
    Dl_info info;
    void *symbol = nullptr;
    return dladdr1(Exported(name), &info, &symbol, RTLD_DL_SYMENT) && symbol
               ? static_cast<const ElfW(Sym) *>(symbol)->st_size
               : 0;
}

constexpr size_t kBeforeSlots = 2; // offset to the top, type
constexpr size_t kSlots = 6;

void ExpectTable(const std::string &name) {
    const std::string type = "4VANO9FILEINDEX" + name;
    const std::array<std::string, kSlots> slots = {
        "_ZN" + type + "D1Ev",
        "_ZN" + type + "D0Ev",
        "_ZN" + type + "4LoadEv",
        "_ZN" + type + "4SaveEv",
        "_ZNK" + type + "11GetLockPathB5cxx11Ev",
        "_ZNK" + type + "7GetPathB5cxx11Ev",
    };
    ASSERT_EQ(SizeOf("_ZTVN" + type + "E"), (kBeforeSlots + kSlots) * sizeof(void *));
    void **const table = static_cast<void **>(Exported("_ZTVN" + type + "E")) + kBeforeSlots;
    for (size_t i = 0; i < kSlots; ++i) {
        EXPECT_NE(table[i], nullptr) << slots[i];
        EXPECT_EQ(table[i], Exported(slots[i])) << "slot " << i << ": " << slots[i];
    }
}

TEST(VirtualTable, Folders) {
    ExpectTable("7Folders");
}
TEST(VirtualTable, Status) {
    ExpectTable("6Status");
}

// What is in the slots of a class without objects is up to the compiler.
TEST(VirtualTable, ConfigHasNoMore) {
    EXPECT_EQ(SizeOf("_ZTVN4VANO9FILEINDEX6ConfigE"), (kBeforeSlots + kSlots) * sizeof(void *));
}

// --- Results ----------------------------------------------------------------------------------

template <class Result, class... Parameters>
Result ResultOf(Result (*)(Parameters...));
template <class Class, class Result, class... Parameters>
Result ResultOf(Result (Class::*)(Parameters...));
template <class Class, class Result, class... Parameters>
Result ResultOf(Result (Class::*)(Parameters...) const);

template <class Result, class... Functions>
constexpr bool Return(Functions... functions) {
    return (std::is_same_v<decltype(ResultOf(functions)), Result> && ...);
}

// The one of an overloaded name's functions that has this type.
template <class Function>
constexpr Function *Pick(Function *function) {
    return function;
}
template <class Class, class Function>
constexpr Function Class::*PickOf(Function Class::*function) {
    return function;
}

using String = std::string;
using Json::Value;
using List = std::vector<Folder>;

static_assert(Return<bool>(&GetShareNameByPath, &GetFullPath, &GetShareNamePathByFullPath,
                           &StringStartWith, &IsFileExist, &IsDirExist, &RetrieveBoolFromJsonObj,
                           &RetrieveStringFromJsonObj, &CanShareBeIndexed,
                           &IsSystemPreservedFileName, &IsSkipIndex, &IsShareSpaceEnough,
                           &CanFullPathBeIndexed, &CanPathBeIndexed, &SendCammandToDaemon,
                           &AddCustomEvent, &NotifyNoSpace, &Updater_zem60_beta2));
// The names of C hold no parameters either.
static_assert(std::is_same_v<decltype(FILEIDXIsShareIndexed), int(const char *)> &&
              std::is_same_v<decltype(FILEIDXIsPathIndexed), int(const char *)> &&
              std::is_same_v<decltype(FILEIDXIsFullPathIndexed), int(const char *)> &&
              std::is_same_v<decltype(FILEIDXDBPathGet), int(const char *, char *, int)> &&
              std::is_same_v<decltype(FILEIDXQueuePathGet), int(const char *, char *, int)>);
static_assert(Return<String>(&ReplaceShareName) && Return<Value>(&GetMostSuitableCfg));
static_assert(
    Return<bool>(&Config::LoadJson, &Config::SaveJson, &Config::Lock, &Folders::Load,
                 &Folders::Save, &Folders::Get, PickOf<Folders, bool(List &)>(&Folders::List),
                 PickOf<Folders, bool(List &, const String &)>(&Folders::List),
                 PickOf<Folders, bool(Value &, unsigned long, unsigned long, const String &,
                                      const String &, const Value &)>(&Folders::List),
                 &Folders::Upsert, &Folders::Delete));
static_assert(Return<void>(&Config::Unlock, &ErrorHandler::SetError) &&
              Return<_tag_fileindex_err_>(&ErrorHandler::GetError));
static_assert(Return<String>(&Config::GetPath, &Config::GetLockPath, &Folder::GetFullPath,
                             &StatusMgr::GetFolderStatus));
static_assert(
    Return<bool>(&Folder::Load, &Folder::Reload, &Folder::SetPath, &Folder::AddToJson,
                 PickOf<Folder, bool(Value &, const String &) const>(&Folder::GetAdditional),
                 PickOf<Folder, bool(Value &, const Value &) const>(&Folder::GetAdditional)) &&
    Return<Value>(PickOf<Folder, Value() const>(&Folder::asJson),
                  PickOf<Folder, Value(const Value &) const>(&Folder::asJson)));
static_assert(Return<bool>(&Status::Load, &Status::Save, &Status::Pause, &Status::Resume,
                           &Status::GetPauseInfo, &Status::ShareSetNoSpace, &Status::ShareIsNoSpace,
                           &Status::ShareSetNeedReindex, &Status::ShareIsNeedReindex,
                           &Status::IsUpdated, &Status::SetUpdated));
static_assert(Return<bool>(&StatusMgr::Pause, &StatusMgr::Resume, &StatusMgr::GetPauseInfo,
                           &StatusMgr::ShareSetNoSpace, &StatusMgr::ShareIsNoSpace,
                           &StatusMgr::ShareSetNeedReindex, &StatusMgr::ShareIsNeedReindex,
                           &StatusMgr::ShareRevive, &StatusMgr::IsUpdated, &StatusMgr::SetUpdated,
                           &StatusMgr::GetStatus));
static_assert(
    Return<bool>(&IndexMgr::IsShareIndexed, Pick<bool(const String &)>(&IndexMgr::IsPathIndexed),
                 Pick<bool(const String &, const List &)>(&IndexMgr::IsPathIndexed),
                 Pick<bool(const String &)>(&IndexMgr::IsPathContainIndexed),
                 Pick<bool(const String &, const List &)>(&IndexMgr::IsPathContainIndexed),
                 Pick<bool(const String &)>(&IndexMgr::IsFullPathIndexed),
                 Pick<bool(const String &, const List &)>(&IndexMgr::IsFullPathIndexed),
                 &IndexMgr::Upsert, &IndexMgr::Add, &IndexMgr::Set, &IndexMgr::Delete,
                 &IndexMgr::Reindex, &IndexMgr::Update, Pick<bool(List &)>(&IndexMgr::List),
                 Pick<bool(Value &, unsigned long, unsigned long, const String &, const String &,
                           const Value &)>(&IndexMgr::List),
                 &IndexMgr::Get, &IndexMgr::ShareRemove, &IndexMgr::ShareRename,
                 &IndexMgr::SharePause, &IndexMgr::ShareResume, &IndexMgr::CleanShareIndexData,
                 &IndexMgr::UpsertVANotifydCfg, &IndexMgr::DeleteVANotifydCfg));

} // namespace
