#include <algorithm>
#include <fileindex/index_mgr.h>
#include <iostream>
#include <memory>
#include <unistd.h>

#include "commands/command.h"
#include "commands/query_reason.h"
#include "state/asked_path.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/terminal.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] =
    R"(A path is indexed if it is an indexed folder or lies in one. --why names the
folder and its file types, and tells what keeps the path out of the index.

Exit status: 0 if all of them are indexed, 3 otherwise.

Examples:
  fileindexctl query /photos/2016
  fileindexctl query --full-path /volume1/photos/2016/a.jpg
  fileindexctl query --why /volume1/photos/@eaDir
  fileindexctl query --share photos music --json)";

struct Options {
    std::vector<std::string> asked;
    bool isShare = false;
    bool isFullPath = false;
    bool isWhy = false;
    JsonMode json = JsonMode::kOff;
};

struct Answer {
    bool isIndexed;
    Reason reason;
};

const char *Word(const Answer &answer) {
    return answer.isIndexed ? "indexed" : "not indexed";
}

Answer AnswerTo(const std::string &asked, const Options &options,
                const std::vector<Folder> &folders) {
    if (options.isShare) {
        const std::string share = NameOfShare(asked);
        return {IndexMgr::IsShareIndexed(share),
                options.isWhy ? ReasonOfShare(share, folders) : Reason()};
    }
    PathForms path;
    if (options.isFullPath) {
        path = {SharePathOfFullPath(asked), asked};
    } else if (ToSharePath(path.sharePath, asked)) {
        path.fullPath = ToFullPath(path.sharePath);
    }
    const bool isIndexed = options.isFullPath ? IndexMgr::IsFullPathIndexed(path.fullPath, folders)
                                              : IndexMgr::IsPathIndexed(path.sharePath, folders);
    return {isIndexed, options.isWhy ? ReasonOf(path, isIndexed, folders) : Reason()};
}

Json::Value AsJson(const std::string &asked, const Answer &answer, bool isWhy) {
    Json::Value value = isWhy ? answer.reason.facts : Json::Value(Json::objectValue);
    value["asked"] = asked;
    value["indexed"] = answer.isIndexed;
    return value;
}

void PrintWithReasons(const std::vector<std::string> &asked, const std::vector<Answer> &answers) {
    for (std::size_t i = 0; i < asked.size(); ++i) {
        std::cout << Word(answers[i]) << "  " << Shown(asked[i]) << '\n';
        for (const std::string &line : answers[i].reason.lines) {
            std::cout << Wrapped("  " + line, LineWidth(STDOUT_FILENO), 4) << '\n';
        }
    }
}

void Print(const std::vector<std::string> &asked, const std::vector<Answer> &answers) {
    Table table({"ANSWER", "PATH"});
    for (std::size_t i = 0; i < asked.size(); ++i) {
        table.Add({Word(answers[i]), asked[i]});
    }
    table.Print();
}

void PrintAsJson(const std::vector<Answer> &answers, const Options &options) {
    Json::Value list(Json::objectValue);
    for (std::size_t i = 0; i < answers.size(); ++i) {
        list["query"].append(AsJson(options.asked[i], answers[i], options.isWhy));
    }
    PrintJson(list, options.json);
}

ExitCode Run(const Options &options) {
    // The queries answer no for settings that cannot be loaded.
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot tell what is indexed");
    }
    std::vector<Answer> answers;
    for (const std::string &asked : options.asked) {
        answers.push_back(AnswerTo(asked, options, folders));
    }
    if (options.json != JsonMode::kOff) {
        PrintAsJson(answers, options);
    } else if (options.isWhy) {
        PrintWithReasons(options.asked, answers);
    } else {
        Print(options.asked, answers);
    }
    const bool isAll = std::all_of(answers.begin(), answers.end(),
                                   [](const Answer &answer) { return answer.isIndexed; });
    return isAll ? kDone : kNotFound;
}

std::string MistakeIn(const Options &options) {
    for (const std::string &asked : options.asked) {
        std::string mistake = options.isShare      ? std::string()
                              : options.isFullPath ? CheckFullPath(asked)
                                                   : CheckSharePath(asked);
        if (!mistake.empty()) {
            return mistake;
        }
    }
    return {};
}

} // namespace

Action DeclareQuery(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->asked, "Share paths or full paths");
    CLI::Option *share =
        app.add_flag("--share", options->isShare, "The arguments are names of shares");
    app.add_flag("--full-path", options->isFullPath,
                 "The arguments are full paths, whatever they look like")
        ->excludes(share);
    app.add_flag("--why", options->isWhy, "Show the reason too");
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    app.callback([options] {
        const std::string mistake = MistakeIn(*options);
        if (!mistake.empty()) {
            throw CLI::ValidationError(mistake);
        }
    });
    return [options] { return Run(*options); };
}

} // namespace CTL
