// The input is a command line of fileindexctl, one argument a line; what follows a line "%%" is
// folder.conf.
//
// The tool ends with one of its exit codes and says why; a mistake in the call changes nothing;
// what it prints is JSON where it says so, and moves no cursor where it does not.

#include <algorithm>
#include <iostream>
#include <sstream>

#include "support/check.h"
#include "support/fake_platform.h"
#include "support/naive.h"
#include "support/world.h"

// The tool's main(), renamed by the build.
int FileindexctlMain(int argc, char **argv);

namespace {

using namespace VANO::FUZZ;

constexpr char kSeparator[] = "%%";
constexpr int kLargestExitCode = 4;
constexpr int kMistake = 2;
constexpr std::size_t kMostArguments = 24;
// Commands that go on until they are stopped, or that ask the machine rather than the library.
constexpr const char *kLeftOut[] = {"watch", "doctor"};

struct Input {
    std::vector<std::string> arguments{"fileindexctl"};
    std::string conf;
};

Input Split(const std::string &text) {
    Input input;
    const std::vector<std::string> lines = Lines(text);
    const auto separator = std::find(lines.begin(), lines.end(), kSeparator);
    for (auto line = lines.begin(); line != separator; ++line) {
        input.arguments.emplace_back(line->c_str()); // an argument ends at a zero byte
    }
    input.arguments.resize(std::min(input.arguments.size(), kMostArguments));
    for (auto line = separator; line != lines.end() && ++line != lines.end();) {
        input.conf += *line + "\n";
    }
    return input;
}

bool IsLeftOut(const std::vector<std::string> &arguments) {
    return std::any_of(std::begin(kLeftOut), std::end(kLeftOut), [&](const char *word) {
        return std::find(arguments.begin(), arguments.end(), word) != arguments.end();
    });
}

// While it lives, what a stream is given is kept.
class Captured {
  public:
    explicit Captured(std::ostream &stream) : stream_(stream), old_(stream.rdbuf(text_.rdbuf())) {}
    Captured(const Captured &) = delete;
    Captured &operator=(const Captured &) = delete;
    ~Captured() { (void)stream_.rdbuf(old_); }

    [[nodiscard]] std::string Text() const { return text_.str(); }

  private:
    std::ostringstream text_;
    std::ostream &stream_;
    std::streambuf *old_;
};

struct Outcome {
    int code;
    std::string output;
    std::string messages;
};

Outcome RunTool(std::vector<std::string> arguments) {
    std::vector<char *> argv;
    for (std::string &argument : arguments) {
        argv.push_back(argument.data());
    }
    argv.push_back(nullptr);
    const Captured output(std::cout);
    const Captured messages(std::cerr);
    const int code = FileindexctlMain(static_cast<int>(arguments.size()), argv.data());
    return {code, output.Text(), messages.Text()};
}

bool IsPlain(const std::string &text) {
    return std::none_of(text.begin(), text.end(), [](char c) {
        const auto byte = static_cast<unsigned char>(c);
        return (byte < 0x20 && c != '\n') || byte == 0x7F;
    });
}

bool HasOption(const std::vector<std::string> &arguments, const std::string &option) {
    return std::any_of(arguments.begin(), arguments.end(), [&](const std::string &argument) {
        return argument.compare(0, option.size(), option) == 0;
    });
}

// All that can be seen from outside.
std::string State() {
    std::string state = Get(kFolderFile) + "\n" + Get(kStatusFile);
    for (const std::string &share : ShareNames()) {
        state += "\n" + Get(QueueOf(share));
    }
    return state;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const Input input = Split(std::string(reinterpret_cast<const char *>(data), size));
    if (IsLeftOut(input.arguments)) {
        return 0;
    }
    Run run;
    if (!input.conf.empty()) {
        PutFile(kFolderFile, input.conf);
    }
    const std::string before = State();
    const Outcome outcome = RunTool(input.arguments);
    Check(outcome.code >= 0 && outcome.code <= kLargestExitCode, "an exit code is a known one");
    Check(outcome.code == 0 || !outcome.output.empty() || !outcome.messages.empty(),
          "what is not done is told");
    Check(outcome.code != kMistake || (State() == before && run.Commands().empty()),
          "a mistake in the call changes nothing", outcome.messages);
    Check(outcome.code != kMistake || !outcome.messages.empty(), "and is told");
    Check(IsPlain(outcome.output), "output moves no cursor", outcome.output);
    Check(IsPlain(outcome.messages), "messages move no cursor", outcome.messages);
    const bool isJson = HasOption(input.arguments, "--json") && !outcome.output.empty() &&
                        std::string("{[").find(outcome.output[0]) != std::string::npos;
    Check(!isJson || Parse(outcome.output), "JSON is JSON", outcome.output);
    return 0;
}
