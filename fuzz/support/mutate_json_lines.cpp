// For targets whose input is a file of one JSON text a line: libFuzzer changes the lines by the
// grammar, and doubles, drops, swaps and joins them.

#include <algorithm>
#include <cstdint>

#include "support/json_grammar.h"
#include "support/naive.h"

namespace {

using VANO::FUZZ::JsonGrammar;
using VANO::FUZZ::Lines;

std::string Joined(const std::vector<std::string> &lines, bool endsInNewline) {
    std::string text;
    for (const std::string &line : lines) {
        text += line + "\n";
    }
    if (!endsInNewline && !text.empty()) {
        text.pop_back();
    }
    return text;
}

// A line without its newline takes the next one in.
void Tear(std::vector<std::string> &lines, std::size_t at) {
    if (at + 1 < lines.size()) {
        lines[at] += lines[at + 1];
        lines.erase(lines.begin() + static_cast<std::ptrdiff_t>(at) + 1);
    }
}

void ChangeLines(std::vector<std::string> &lines, JsonGrammar &grammar, std::size_t maxSize) {
    const std::size_t at = grammar.Below(lines.size());
    const auto place = lines.begin() + static_cast<std::ptrdiff_t>(at);
    switch (grammar.Below(10)) {
    case 0:
        lines.insert(place, std::string(*place));
        break;
    case 1:
        lines.erase(place);
        break;
    case 2:
        std::swap(*place, lines[grammar.Below(lines.size())]);
        break;
    case 3:
        Tear(lines, at);
        break;
    default:
        *place = grammar.Mutate(*place, maxSize);
    }
}

std::string MutateLines(const std::string &text, std::size_t maxSize, unsigned seed) {
    JsonGrammar grammar(seed);
    std::vector<std::string> lines = Lines(text);
    if (lines.empty() || grammar.OnceIn(32)) {
        return JsonGrammar::MutateBytes(text, maxSize);
    }
    ChangeLines(lines, grammar, maxSize);
    std::string mutated = Joined(lines, !grammar.OnceIn(8));
    return mutated.size() <= maxSize ? mutated : JsonGrammar::MutateBytes(text, maxSize);
}

} // namespace

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t *data, std::size_t size,
                                               std::size_t maxSize, unsigned seed) {
    const std::string mutated =
        MutateLines(std::string(reinterpret_cast<const char *>(data), size), maxSize, seed);
    return static_cast<std::size_t>(std::copy(mutated.begin(), mutated.end(), data) - data);
}
