// What a lost power line may leave of the settings, by replaying what an operation did to their
// directory. The model of a disk:
//
//   - what was flushed (fsync of the file for its bytes, fsync of the directory for its names) is
//     there;
//   - of the writes to a file since then each may be there, be there by half, be there as zeros of
//     that length, or be missing, whatever became of the others;
//   - of the changes of names since then each may be there or not, whatever became of the others,
//     but one rename() is there whole or not at all.
//
// The line may be lost after every step. In each state that this allows the settings must be one of
// the whole texts that they had; and once the operation has reported success, the last one.

#include <algorithm>
#include <fcntl.h>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <stdexcept>
#include <sys/syscall.h>

#include "calls.h"
#include "parts.h"
#include "support/files.h"
#include "tally.h"
#include "trial.h"
#include "watched_run.h"

namespace VANO::TORTURE {

namespace {

struct Step {
    enum class Kind { kWrite, kTruncate, kName, kRename, kRemove, kFlushFile, kFlushNames };
    Kind kind;
    int file = -1;        // an inode, as this program numbers them
    std::string name;     // that it gets or loses
    std::string formerly; // rename's other one
    std::size_t offset = 0;
    std::string bytes;
};

using Contents = std::set<std::string>;

// --- what the operation did ---------------------------------------------------------------------

class Recorder {
  public:
    explicit Recorder(const Snapshot &before) {
        for (const auto &[path, text] : before) {
            if (IsSetting(path)) {
                names_[path] = static_cast<int>(texts_.size());
                texts_.push_back(text);
            }
        }
        atStart = names_;
        textsAtStart = texts_;
    }

    void OnExit(const SystemCall &call, long result) {
        if (call.process != 0 || result < 0) {
            return;
        }
        switch (call.number) {
        case SYS_openat:
            OnOpen(call, static_cast<int>(result));
            break;
        case SYS_close:
            open_.erase(static_cast<int>(call.arguments[0]));
            break;
        case SYS_write:
            OnWrite(call, static_cast<std::size_t>(result));
            break;
        case SYS_ftruncate:
            OnTruncate(call);
            break;
        case SYS_fsync:
            OnFlush(call);
            break;
        case SYS_rename:
            OnRename(SubjectOf(call), ReadString(call.pid, call.arguments[1]));
            break;
        case SYS_unlink:
            OnRemove(SubjectOf(call));
            break;
        case SYS_pwrite64:
        case SYS_renameat2:
        case SYS_unlinkat:
        case SYS_creat:
            throw std::logic_error("the recorder does not know " + NameOf(call));
        default:
            break;
        }
    }

    std::map<std::string, int> atStart; // names of files that are there
    std::vector<std::string> textsAtStart;
    std::vector<Step> steps;

  private:
    struct OpenFile {
        int file;
        std::size_t offset;
    };

    static bool IsSetting(const std::string &path) {
        return path.rfind(std::string(kSettingsDirectory) + "/", 0) == 0;
    }

    void OnOpen(const SystemCall &call, int fd) {
        const std::string path = SubjectOf(call);
        if (!IsSetting(path) || (call.arguments[2] & O_ACCMODE) == O_RDONLY) {
            return;
        }
        if (names_.count(path) == 0) {
            names_[path] = static_cast<int>(texts_.size());
            texts_.emplace_back();
            steps.push_back({Step::Kind::kName, names_[path], path, "", 0, ""});
        }
        open_[fd] = {names_[path], 0};
        if ((call.arguments[2] & O_TRUNC) != 0) {
            steps.push_back({Step::Kind::kTruncate, names_[path], "", "", 0, ""});
        }
    }

    OpenFile *Find(const SystemCall &call) {
        const auto found = open_.find(static_cast<int>(call.arguments[0]));
        return found == open_.end() ? nullptr : &found->second;
    }

    void OnWrite(const SystemCall &call, std::size_t size) {
        if (OpenFile *const open = Find(call)) {
            steps.push_back({Step::Kind::kWrite, open->file, "", "", open->offset,
                             ReadBytes(call.pid, call.arguments[1], size)});
            open->offset += size;
        }
    }

    void OnTruncate(const SystemCall &call) {
        if (const OpenFile *const open = Find(call)) {
            steps.push_back({Step::Kind::kTruncate, open->file, "", "", call.arguments[1], ""});
        }
    }

    void OnFlush(const SystemCall &call) {
        if (const OpenFile *const open = Find(call)) {
            steps.push_back({Step::Kind::kFlushFile, open->file, "", "", 0, ""});
        } else if (SubjectOf(call) == kSettingsDirectory) {
            steps.push_back({Step::Kind::kFlushNames, -1, "", "", 0, ""});
        }
    }

    void OnRename(const std::string &from, const std::string &to) {
        if (IsSetting(to)) {
            steps.push_back({Step::Kind::kRename, names_.at(from), to, from, 0, ""});
            names_[to] = names_.at(from);
            names_.erase(from);
        }
    }

    void OnRemove(const std::string &path) {
        if (IsSetting(path)) {
            steps.push_back({Step::Kind::kRemove, names_.at(path), path, "", 0, ""});
            names_.erase(path);
        }
    }

    std::map<std::string, int> names_;
    std::vector<std::string> texts_;
    std::map<int, OpenFile> open_;
};

// --- what may be left of it ---------------------------------------------------------------------

std::string Overwritten(std::string text, const Step &step, const std::string &bytes) {
    text.resize(std::max(text.size(), step.offset + bytes.size()));
    return text.replace(step.offset, bytes.size(), bytes);
}

void Apply(Contents &contents, const Step &step) {
    Contents more;
    for (const std::string &text : contents) {
        if (step.kind == Step::Kind::kTruncate) {
            std::string cut = text;
            cut.resize(step.offset);
            more.insert(cut);
            continue;
        }
        more.insert(Overwritten(text, step, step.bytes));
        more.insert(Overwritten(text, step, step.bytes.substr(0, step.bytes.size() / 2)));
        more.insert(Overwritten(text, step, std::string(step.bytes.size(), '\0')));
    }
    contents.insert(more.begin(), more.end());
}

class Disk {
  public:
    explicit Disk(const Recorder &record) : names_(record.atStart) {
        for (const std::string &text : record.textsAtStart) {
            files_.push_back({text, {text}});
        }
    }

    void Do(const Step &step) {
        switch (step.kind) {
        case Step::Kind::kWrite:
        case Step::Kind::kTruncate:
            Apply(files_[static_cast<std::size_t>(step.file)].possible, step);
            Whole(step);
            break;
        case Step::Kind::kFlushFile: {
            File &file = files_[static_cast<std::size_t>(step.file)];
            file.possible = {file.whole};
            break;
        }
        case Step::Kind::kFlushNames:
            for (const Step &change : changes_) {
                Rename(names_, change);
            }
            changes_.clear();
            break;
        case Step::Kind::kName:
            files_.push_back({"", {""}});
            changes_.push_back(step);
            break;
        default:
            changes_.push_back(step);
            break;
        }
    }

    const std::string &WholeTextOf(int file) const {
        return files_[static_cast<std::size_t>(file)].whole;
    }

    // Every content that `path` may have; no text stands for no file.
    std::set<std::optional<std::string>> Possible(const std::string &path) const {
        std::set<std::optional<std::string>> possible;
        for (unsigned chosen = 0; chosen < 1U << changes_.size(); ++chosen) {
            std::map<std::string, int> names = names_;
            for (std::size_t i = 0; i < changes_.size(); ++i) {
                if ((chosen >> i & 1U) != 0) {
                    Rename(names, changes_[i]);
                }
            }
            const auto found = names.find(path);
            if (found == names.end()) {
                possible.insert(std::nullopt);
                continue;
            }
            const Contents &texts = files_[static_cast<std::size_t>(found->second)].possible;
            possible.insert(texts.begin(), texts.end());
        }
        return possible;
    }

  private:
    struct File {
        std::string whole;
        Contents possible;
    };

    void Whole(const Step &step) {
        std::string &text = files_[static_cast<std::size_t>(step.file)].whole;
        if (step.kind == Step::Kind::kTruncate) {
            text.resize(step.offset);
        } else {
            text = Overwritten(text, step, step.bytes);
        }
    }

    static void Rename(std::map<std::string, int> &names, const Step &change) {
        names.erase(change.formerly);
        if (change.kind == Step::Kind::kRemove) {
            names.erase(change.name);
        } else {
            names[change.name] = change.file;
        }
    }

    std::map<std::string, int> names_;
    std::vector<File> files_;
    std::vector<Step> changes_; // of names, since they were flushed
};

using Texts = std::set<std::optional<std::string>>;

std::optional<std::string> TextIn(const Snapshot &snapshot, const std::string &path) {
    const auto found = snapshot.find(path);
    return found == snapshot.end() ? std::nullopt : std::optional<std::string>(found->second);
}

std::string Describe(const std::optional<std::string> &text) {
    return text ? "\"" + text->substr(0, 60) + "\"" : "no file";
}

// How often a state is one that must not be, and how many states there are.
struct Judgement {
    long states = 0;
    std::string complaint;
};

Judgement Judge(const Recorder &record, const std::vector<Step> &steps, const std::string &path,
                const Snapshot &before, const Snapshot &after) {
    Judgement judgement;
    Disk disk(record);
    Texts allowed{TextIn(before, path)};
    const auto look = [&](const Texts &right, const std::string &when) {
        for (const auto &text : disk.Possible(path)) {
            ++judgement.states;
            if (right.count(text) == 0) {
                judgement.complaint = when + " " + path + " may be " + Describe(text);
            }
        }
    };
    for (std::size_t i = 0; i < steps.size(); ++i) {
        disk.Do(steps[i]);
        if (steps[i].kind == Step::Kind::kRename && steps[i].name == path) {
            allowed.insert(disk.WholeTextOf(steps[i].file));
        }
        look(allowed, "after step " + std::to_string(i));
    }
    look({TextIn(after, path)}, "in the end");
    return judgement;
}

Recorder Record(const Trial &trial) {
    Recorder record(trial.Before());
    const Shared<Disturbance> none;
    Hooks hooks;
    hooks.onEntry = [](const SystemCall &) { return Decision{}; };
    hooks.onExit = [&](const SystemCall &call, long result) { record.OnExit(call, result); };
    const std::string complaint = trial.Run(hooks, none);
    if (!complaint.empty()) {
        throw std::runtime_error(std::string(trial.Subject().name) + ", recorded: " + complaint);
    }
    return record;
}

// The judge must object to the same steps without one of their flushes.
std::string CheckJudge(const Recorder &record, Step::Kind flush, const std::string &path,
                       const Trial &trial) {
    std::vector<Step> steps = record.steps;
    const auto isFlush = [&](const Step &step) { return step.kind == flush; };
    steps.erase(std::remove_if(steps.begin(), steps.end(), isFlush), steps.end());
    const bool objects =
        !Judge(record, steps, path, trial.Before(), trial.After()).complaint.empty();
    return objects ? "" : "the judge does not see that a flush is missing";
}

} // namespace

long SweepPowerLoss(const Options &options) {
    Tally tally("power-loss");
    long states = 0;
    long steps = 0;
    const int operations = ForEachOperation(options, true, [&](const Operation &operation) {
        const Trial trial(operation);
        const Recorder record = Record(trial);
        steps += static_cast<long>(record.steps.size());
        for (const std::string path : {kFolderFile, kStatusFile}) {
            const Judgement judgement =
                Judge(record, record.steps, path, trial.Before(), trial.After());
            states += judgement.states;
            tally.Count(operation.name, judgement.complaint);
            if (TextIn(trial.Before(), path) == TextIn(trial.After(), path)) {
                continue;
            }
            for (const auto flush : {Step::Kind::kFlushFile, Step::Kind::kFlushNames}) {
                tally.Count(operation.name, CheckJudge(record, flush, path, trial));
            }
        }
    });
    return tally.SumUp(std::to_string(operations) + " operations, " + std::to_string(steps) +
                       " steps on the disk, " + std::to_string(states) + " states");
}

} // namespace VANO::TORTURE
