#ifndef FILEINDEX_BASE_PLAIN_JSON_H
#define FILEINDEX_BASE_PLAIN_JSON_H

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace VANO::FILEINDEX {

constexpr int kMaxPlainDepth = 16; // far below what the JSON library refuses

// A run of decimal digits.
struct Digits {
    std::size_t count;
    std::int64_t value;
};

// The digits that eight bytes begin with; {0, 0} when all are digits, which says nothing. All bytes
// are looked at in one step: a loop would end somewhere else for each number, and a processor that
// guesses wrong where a loop ends loses more time than the digits take.
[[nodiscard]] inline Digits DigitsAmongEight(const char *bytes) {
#if __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__
    std::uint64_t chunk = 0;
    std::memcpy(&chunk, bytes, sizeof(chunk));
    // What is left of a digit is 0 to 9: neither it nor 6 more than it reaches the upper half.
    chunk ^= 0x3030303030303030U;
    const std::uint64_t others = (chunk | (chunk + 0x0606060606060606U)) & 0xF0F0F0F0F0F0F0F0U;
    const int count = others != 0 ? __builtin_ctzll(others) / 8 : 0;
    if (count == 0) {
        return {0, 0};
    }
    // Zeros before the digits, then sums of two, four and eight of them.
    chunk <<= (8 - count) * 8;
    chunk = (chunk * (10 * 0x100 + 1)) >> 8 & 0x00FF00FF00FF00FFU;
    chunk = (chunk * (100 * 0x10000 + 1)) >> 16 & 0x0000FFFF0000FFFFU;
    chunk = (chunk * (10000 * 0x100000000U + 1)) >> 32;
    return {static_cast<std::size_t>(count), static_cast<std::int64_t>(chunk)};
#else
    (void)bytes;
    return {0, 0};
#endif
}

// Walks through a JSON text token by token, as long as it is plain: no escapes, no fractions, no
// numbers beyond 18 digits, no deep nesting. That is what settings and events are made of, and what
// every JSON library reads alike.
//
// An operation that fails has said nothing about the text: the JSON library must decide it then.
// What was walked through up to AtEnd() is valid JSON for that library. Strings are parts of the
// text and live as long.
class PlainJson {
  public:
    explicit PlainJson(std::string_view text)
        : at_(text.data()), end_(text.data() + text.size()),
          escaped_(text.find('\\') != std::string_view::npos) {}

    // This one character, which is no white space.
    [[nodiscard]] bool Take(char mark) {
        const bool taken = (at_ != end_ && *at_ == mark) || Next() == mark;
        at_ += taken ? 1 : 0;
        return taken;
    }

    // These characters one after another, the first no white space. For a word, what may follow it
    // is the next Take()'s business.
    [[nodiscard]] bool TakeExactly(std::string_view characters) {
        if (Next() != characters.front() || Left() < characters.size() ||
            std::memcmp(at_, characters.data(), characters.size()) != 0) {
            return false;
        }
        at_ += characters.size();
        return true;
    }

    // A whole object or array: `takeItem` takes one thing that stands between its commas.
    template <typename TakeItem>
    [[nodiscard]] bool TakeBetween(char open, char close, TakeItem takeItem) {
        if (depth_ == kMaxPlainDepth || !Take(open)) {
            return false;
        }
        if (Take(close)) {
            return true;
        }
        ++depth_;
        do {
            if (!takeItem()) {
                return false;
            }
        } while (Take(','));
        --depth_;
        return Take(close);
    }

    [[nodiscard]] bool TakeString(std::string_view &value) {
        if (escaped_ || !Take('"')) {
            return false;
        }
        const auto *const quote = static_cast<const char *>(std::memchr(at_, '"', Left()));
        if (quote == nullptr) {
            return false;
        }
        value = std::string_view(at_, static_cast<std::size_t>(quote - at_));
        at_ = quote + 1;
        return true;
    }

    [[nodiscard]] bool TakeInteger(std::int64_t &value) {
        const bool negative = Take('-');
        const Digits few = Left() >= 8 ? DigitsAmongEight(at_) : Digits{0, 0};
        const Digits digits = few.count != 0 ? few : DigitsOneByOne();
        at_ += digits.count;
        value = negative ? -digits.value : digits.value;
        return digits.count != 0;
    }

    // Whether nothing but white space is left.
    [[nodiscard]] bool AtEnd() { return Next() == '\0' && at_ == end_; }

    // The character that the next token begins with; '\0' at the end.
    [[nodiscard]] char Next() {
        while (at_ != end_ && IsSpace(*at_)) {
            ++at_;
        }
        return at_ != end_ ? *at_ : '\0';
    }

  private:
    static constexpr std::size_t kMaxDigits = 18; // never too large for 64 bits

    [[nodiscard]] Digits DigitsOneByOne() const {
        Digits digits{0, 0};
        for (; digits.count < kMaxDigits && at_ + digits.count != end_; ++digits.count) {
            const char c = at_[digits.count];
            if (c < '0' || c > '9') {
                break;
            }
            digits.value = digits.value * 10 + (c - '0');
        }
        return digits;
    }

    static bool IsSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }
    [[nodiscard]] std::size_t Left() const { return static_cast<std::size_t>(end_ - at_); }

    const char *at_;
    const char *end_;
    bool escaped_;
    int depth_ = 0;
};

} // namespace VANO::FILEINDEX

#endif
