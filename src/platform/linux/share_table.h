#ifndef VANO_PLATFORM_SHARE_TABLE_H
#define VANO_PLATFORM_SHARE_TABLE_H

#include <cstddef>
#include <json/value.h>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "diagnosis.h"

namespace VANO::PLATFORM {

// The share table is the file /usr/vano/etc/shares.json, one JSON object. Each member is a share:
//
//     {
//         "photos": "/volume1/photos",
//         "Music":  {"path": "/volume2/Music", "read_only": true}
//     }
//
// The member's name is the share's name; its value is the share's directory, or an object with
//
//     "path"        string, the directory; required
//     "encrypted"   boolean, default false: an encrypted share
//     "read_only"   boolean, default false: nobody may write to it
//     "encryption"  boolean, default false: uses encryption, so that its folder is a mount
//
// Other members of that object are ignored. Names are matched without regard to case and answered
// as they are spelt here. A directory is absolute, without "." and ".." components, and its last
// component is the share's name (in any case): full paths are made from its parent directory and a
// path that begins with the share's name. Doubled and trailing slashes are dropped.
//
// An entry that breaks these rules, or repeats the name or the directory of an earlier one in the
// byte order of names, is left out with one line in the log. A table that is missing, unreadable or
// not a JSON object holds no shares; that is one line in the log too, once for each state of the
// file.
struct TableShare {
    std::string name;
    std::string path;
    bool encrypted = false;
    bool readOnly = false;
    bool encryption = false;
};

// One state of the table; never changes.
class ShareTable {
  public:
    // The table as the file holds it. Throws std::bad_alloc only.
    [[nodiscard]] static ShareTable Load();

    // False for a table that could not be read.
    [[nodiscard]] bool IsUsable() const { return usable_; }

    // What is wrong with it. Where the whole table is of no use that is the only fault.
    [[nodiscard]] const std::vector<StoreFault> &Faults() const { return faults_; }

    [[nodiscard]] const std::vector<TableShare> &Shares() const { return shares_; }

    // Null when there is no such share.
    [[nodiscard]] const TableShare *FindByName(std::string_view name) const;

    // The share with the longest directory that is the full path or holds it by whole components.
    // The path is taken as it is written: ".." is a name. Null when it lies in no share.
    [[nodiscard]] const TableShare *FindByFullPath(std::string_view fullPath) const;

  private:
    void AddFault(StoreFault::Kind kind, std::string reason, std::string entry = {});
    void AddEntry(const std::string &name, const Json::Value &value);

    bool usable_ = false;
    std::vector<StoreFault> faults_;
    std::vector<TableShare> shares_;
    std::unordered_map<std::u32string, std::size_t> byName_; // by case-folded name
    std::unordered_map<std::string, std::size_t> byPath_;
    std::size_t longestPath_ = 0;
};

// The table as the file holds it now. Costs one stat() while the file is unchanged; a changed file
// is read once, while other threads wait for it. Throws std::bad_alloc only.
std::shared_ptr<const ShareTable> CurrentShareTable();

// Reads the entry `name`: `value` of the table. The rule that it breaks, as a clause; null, with
// `share` filled, when it keeps them all.
[[nodiscard]] const char *ReadTableEntry(TableShare &share, const std::string &name,
                                         const Json::Value &value);

} // namespace VANO::PLATFORM

#endif
