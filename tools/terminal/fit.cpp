#include "terminal/fit.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "terminal/text.h"

namespace CTL {

namespace {

std::string Repeated(const char *text, std::size_t times) {
    std::string repeated;
    for (std::size_t i = 0; i < times; ++i) {
        repeated += text;
    }
    return repeated;
}

// The characters of a valid text, each with what takes no column of its own behind it.
std::vector<std::string> CharactersOf(const std::string &shown) {
    std::vector<std::string> characters;
    for (const char byte : shown) {
        const bool isFirst = (static_cast<unsigned char>(byte) & 0xC0U) != 0x80U;
        if (isFirst || characters.empty()) {
            characters.emplace_back();
        }
        characters.back() += byte;
    }
    for (std::size_t i = characters.size(); i-- > 1;) {
        if (Columns(characters[i]) == 0) {
            characters[i - 1] += characters[i];
            characters.erase(characters.begin() + static_cast<std::ptrdiff_t>(i));
        }
    }
    return characters;
}

} // namespace

std::string Fit(const std::string &shown, std::size_t columns, const Style &style) {
    if (Columns(shown) <= columns) {
        return shown;
    }
    const std::string gap = style.isUtf8 ? "…" : "...";
    if (columns <= Columns(gap)) {
        return std::string(columns, '.'); // NOLINT(modernize-return-braced-init-list): a count
    }
    const std::vector<std::string> characters = CharactersOf(shown);
    std::size_t room = columns - Columns(gap);
    std::string head;
    std::string tail;
    std::size_t first = 0;
    std::size_t last = characters.size();
    // The end of a name tells more than its beginning, so it is served first.
    for (bool isTail = true; first < last; isTail = !isTail) {
        const std::string &next = isTail ? characters[last - 1] : characters[first];
        if (Columns(next) > room) {
            break;
        }
        room -= Columns(next);
        if (isTail) {
            tail.insert(0, next);
            --last;
        } else {
            head += next;
            ++first;
        }
    }
    return head + gap + tail;
}

std::string Bar(double fraction, std::size_t columns, const Style &style) {
    const std::size_t frame = style.isUtf8 ? 0 : 2;
    if (columns <= frame) {
        return std::string(columns, ' '); // NOLINT(modernize-return-braced-init-list): a count
    }
    const std::size_t inside = columns - frame;
    const double wanted = std::floor(std::clamp(fraction, 0.0, 1.0) * static_cast<double>(inside));
    const auto filled = static_cast<std::size_t>(wanted);
    if (style.isUtf8) {
        return Repeated("█", filled) + Repeated("░", inside - filled);
    }
    return "[" + std::string(filled, '#') + std::string(inside - filled, '-') + "]";
}

} // namespace CTL
