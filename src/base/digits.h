#ifndef FILEINDEX_BASE_DIGITS_H
#define FILEINDEX_BASE_DIGITS_H

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace VANO::FILEINDEX {

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

} // namespace VANO::FILEINDEX

#endif
