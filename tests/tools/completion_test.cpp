// What the shells offer where a person presses Tab. The shells are driven by small scripts that
// print each offer on a line.

#include <gmock/gmock.h>
#include <unistd.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::IsSupersetOf;

struct Shell {
    const char *name;
    const char *path;

    friend void PrintTo(const Shell &shell, std::ostream *out) { *out << shell.name; }
};

// The words up to the cursor arrive as arguments, the last of them the one that is completed.
constexpr char kBashDriver[] = R"(. "$0"/fileindexctl.bash
COMP_WORDS=("$@") COMP_CWORD=$(($# - 1))
_fileindexctl
for offer in "${COMPREPLY[@]}"; do printf '%q\n' "$offer"; done)";

// Stands in for the builtins that only work while the line editor completes.
constexpr char kZshDriver[] = R"(words=("$@") CURRENT=$#
compset() { [[ $1 == -P ]] && words[CURRENT]=${words[CURRENT]#${~2}} }
compadd() {
    while [[ $1 != -- ]]; do shift; done
    shift
    for offer; do [[ $offer != "$words[CURRENT]"* ]] || printf '%q\n' $offer; done
}
_files() {
    for offer in $words[CURRENT]*(N/); do print -r -- ${(q)offer}; done
}
. "$ZSH_ARGZERO_DIRECTORY"/_fileindexctl)";

class CompletionTest : public CtlTest, public ::testing::WithParamInterface<Shell> {
  protected:
    void SetUp() override {
        if (::access(GetParam().path, X_OK) != 0) {
            GTEST_SKIP() << GetParam().path << " is not installed";
        }
        CtlTest::SetUp();
    }

    // What is offered for the last of the words; "--option=value" is one word.
    static Words Offers(const Words &typed) {
        const bool isBash = std::string(GetParam().name) == "Bash";
        Words command =
            isBash ? Words{GetParam().path, "-c", kBashDriver, COMPLETIONS}
                   : Words{GetParam().path, "-f", "-c",
                           "ZSH_ARGZERO_DIRECTORY=$0\n" + std::string(kZshDriver), COMPLETIONS};
        command.emplace_back(FILEINDEXCTL_PATH);
        for (const std::string &word : typed) {
            const std::size_t equals = isBash ? word.find('=') : std::string::npos;
            command.push_back(word.substr(0, equals));
            if (equals != std::string::npos) { // as readline breaks words
                command.emplace_back("=");
                if (equals + 1 < word.size()) {
                    command.push_back(word.substr(equals + 1));
                }
            }
        }
        const Outcome outcome = RunToEnd(command);
        EXPECT_EQ(outcome.error, "");
        return LinesOf(outcome.out);
    }
};

TEST_P(CompletionTest, OffersTheCommands) {
    EXPECT_THAT(Offers({""}),
                IsSupersetOf({"list", "show", "add", "set", "remove", "reindex", "pause", "resume",
                              "query", "share", "marks", "migrate", "status", "watch", "doctor"}));
    EXPECT_THAT(Offers({"re"}), UnorderedElementsAre("remove", "reindex", "resume"));
    EXPECT_THAT(Offers({"share", "re"}), UnorderedElementsAre("remove", "rename", "resume"));
    EXPECT_THAT(Offers({"marks", ""}), UnorderedElementsAre("list", "set"));
    EXPECT_THAT(Offers({"zz"}), IsEmpty());
}

TEST_P(CompletionTest, OffersTheOptionsOfTheCommand) {
    EXPECT_THAT(Offers({"list", "--s"}), ElementsAre("--share"));
    EXPECT_THAT(Offers({"add", "/photos", "--"}),
                AllOf(Contains("--photo"), Contains("--dry-run"), Not(Contains("--share"))));
    EXPECT_THAT(Offers({"share", "no-space", "--re"}), ElementsAre("--revive"));
    EXPECT_THAT(Offers({"--ver"}), ElementsAre("--version"));
}

TEST_P(CompletionTest, OffersTheValuesOfAnOption) {
    EXPECT_THAT(Offers({"set", "/photos", "--photo=y"}), ElementsAre("yes"));
    EXPECT_THAT(Offers({"list", "--json="}), UnorderedElementsAre("short", "pretty", "off"));
    EXPECT_THAT(Offers({"list", "--json", ""}), IsEmpty()); // its value is never a word of its own
    EXPECT_THAT(Offers({"set", "/photos", "--photo", ""}), UnorderedElementsAre("yes", "no"));
    EXPECT_THAT(Offers({"list", "--share", "m"}), ElementsAre("media"));
}

TEST_P(CompletionTest, OffersTheConfiguredFolders) {
    Save(kTwo);
    for (const char *command : {"show", "set", "remove", "reindex", "status", "watch"}) {
        EXPECT_THAT(Offers({command, ""}), UnorderedElementsAre("/photos", "/media/films"))
            << command;
        EXPECT_THAT(Offers({command, "/p"}), ElementsAre("/photos")) << command;
    }
}

TEST_P(CompletionTest, OffersShares) {
    for (const char *command : {"pause", "resume", "remove", "clean", "no-space", "rename"}) {
        EXPECT_THAT(Offers({"share", command, ""}), UnorderedElementsAre("media", "photos"))
            << command;
    }
    EXPECT_THAT(Offers({"query", "--share", "p"}), ElementsAre("photos"));
}

TEST_P(CompletionTest, OffersSharesAndDirectoriesToAdd) {
    EXPECT_THAT(Offers({"add", "/pho"}), ElementsAre("/photos"));
    EXPECT_THAT(Offers({"add", "/volume1/photos/20"}), ElementsAre("/volume1/photos/2016"));
}

TEST_P(CompletionTest, OffersTheChecksOfTheDoctor) {
    EXPECT_THAT(Offers({"doctor", ""}),
                UnorderedElementsAre("settings", "locks", "shares", "folders", "daemon", "queues",
                                     "monitor", "spotlight", "room"));
    EXPECT_THAT(Offers({"doctor", "locks", "s"}),
                UnorderedElementsAre("settings", "shares", "spotlight"));
}

TEST_P(CompletionTest, OffersTheMarks) {
    EXPECT_THAT(Offers({"marks", "set", ""}), IsEmpty());
    PutFile(kStatus, R"({"step-1":true,"step 2 done":false,"\u0007":true,"resume_time":0})");
    EXPECT_THAT(Offers({"marks", "set", ""}), UnorderedElementsAre("step-1", "step\\ 2\\ done"));
    EXPECT_THAT(Offers({"marks", "list", ""}), IsEmpty());
}

TEST_P(CompletionTest, SurvivesOddNames) {
    Save("{\"/photos/a b\":{},\"/photos/it's $(date)\":{},\"/photos/\xff\":{}}");
    EXPECT_THAT(Offers({"show", "/"}),
                UnorderedElementsAre("/photos/a\\ b", "/photos/it\\'s\\ \\$\\(date\\)",
                                     ::testing::AnyOf("$'/photos/\\377'", "/photos/$'\\377'")));
}

TEST_P(CompletionTest, SurvivesBrokenSettings) {
    Save("{");
    EXPECT_THAT(Offers({"show", "/"}), IsEmpty());
    EXPECT_THAT(Offers({"share", "pause", ""}), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Shells, CompletionTest,
                         ::testing::Values(Shell{"Bash", "/bin/bash"}, Shell{"Zsh", "/bin/zsh"}),
                         [](const auto &row) { return row.param.name; });

// Of bash alone: what a person has typed still bears the quotes.
TEST_F(CtlTest, BashFindsNamesByTheirQuotedBeginning) {
    Save(R"({"/photos/a b":{},"/photos/ab":{}})");
    for (const char *typed : {R"(/photos/a\ )", "'/photos/a ", "\"/photos/a "}) {
        const Outcome outcome = RunToEnd(
            {"/bin/bash", "-c", kBashDriver, COMPLETIONS, FILEINDEXCTL_PATH, "show", typed});
        EXPECT_EQ(outcome.out, "/photos/a\\ b\n") << typed;
    }
}

// --- at a prompt ----------------------------------------------------------------------------

// Types at the prompt of a shell, presses Tab, and then the key that has the line written down.
constexpr char kTypist[] = R"(zmodload zsh/zpty
export TERM=dumb PATH=$1:$PATH
rm -f /tmp/line
zpty shell $2
zpty -r shell shown '*ready> *'
zpty -n -w shell $3$'\t\x14'
while zpty -r shell shown; do :; done
cat /tmp/line)";

constexpr char kZshSettings[] = R"(autoload -Uz compinit && compinit -u -D
note() { print -r -- "$BUFFER" >/tmp/line; exit }
zle -N note && bindkey '^T' note
PS1='ready> '
)";

constexpr char kBashSettings[] = R"(
note() { printf '%s\n' "$READLINE_LINE" >/tmp/line; exit; }
bind -x '"\C-t": note'
PS1='ready> '
)";

struct Typed {
    const char *line;
    const char *completed;
};

// What the line editors do with an offer: they quote it, and find it by its quoted beginning.
class PromptTest : public CompletionTest {
  protected:
    void SetUp() override {
        if (::access("/bin/zsh", X_OK) != 0) {
            GTEST_SKIP() << "the typist, /bin/zsh, is not installed";
        }
        CompletionTest::SetUp();
        PutFile("/tmp/.zshrc", "fpath=(" COMPLETIONS " $fpath)\n" + std::string(kZshSettings));
        PutFile("/tmp/bashrc", ". " COMPLETIONS "/fileindexctl.bash" + std::string(kBashSettings));
    }

    static std::string AfterTab(const std::string &line) {
        const std::string tool = FILEINDEXCTL_PATH;
        const bool isBash = std::string(GetParam().name) == "Bash";
        return RunToEnd(
                   {"/bin/zsh", "-f", "-c", kTypist, "typist", tool.substr(0, tool.rfind('/')),
                    isBash ? "bash --noprofile --rcfile /tmp/bashrc -i" : "ZDOTDIR=/tmp zsh -d -i",
                    line})
            .out;
    }
};

TEST_P(PromptTest, TabCompletesTheLine) {
    Save(R"({"/photos/a b":{},"/photos/it's (new) & old":{}})");
    PutFile(kStatus, R"({"step 1":true})");
    const Typed rows[] = {
        {"sta", "status "},
        {"list --share p", "list --share photos "},
        {"set /photos --photo=y", "set /photos --photo=yes "},
        {"set /photos --photo y", "set /photos --photo yes "},
        {"doctor loc", "doctor locks "},
        {"marks set st", R"(marks set step\ 1 )"},
        {"add /pho", "add /photos "},
        {"show /photos/a", R"(show /photos/a\ b )"},
        {R"(show /photos/a\ )", R"(show /photos/a\ b )"},
        {"show '/photos/a ", "show '/photos/a b' "},
        {"show /photos/i", R"(show /photos/it\'s\ \(new\)\ \&\ old )"},
        {R"(show "/photos/it's)", R"(show "/photos/it's (new) & old" )"},
    };
    for (const Typed &row : rows) {
        EXPECT_EQ(AfterTab(std::string("fileindexctl ") + row.line),
                  std::string("fileindexctl ") + row.completed + "\n");
    }
}

INSTANTIATE_TEST_SUITE_P(Shells, PromptTest,
                         ::testing::Values(Shell{"Bash", "/bin/bash"}, Shell{"Zsh", "/bin/zsh"}),
                         [](const auto &row) { return row.param.name; });

} // namespace
} // namespace VANO::TESTS
