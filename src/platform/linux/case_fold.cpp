#include "case_fold.h"

#include <utf8proc.h>

#include "vano_platform.h"

namespace VANO::PLATFORM {

namespace {

constexpr char32_t kFirstAfterUnicode = 0x110000;
constexpr unsigned kAsciiEnd = 0x80;

constexpr char32_t FoldAscii(unsigned char byte) {
    return byte >= 'A' && byte <= 'Z' ? byte + ('a' - 'A') : byte;
}

} // namespace

// A valid code point as it stands, or one behind Unicode for a stray byte.
char32_t FoldedCodePoints::Decode() {
    utf8proc_int32_t codePoint = 0;
    const auto *bytes = reinterpret_cast<const utf8proc_uint8_t *>(rest_.data());
    const utf8proc_ssize_t used =
        utf8proc_iterate(bytes, static_cast<utf8proc_ssize_t>(rest_.size()), &codePoint);
    if (used <= 0) {
        const char32_t stray = kFirstAfterUnicode + bytes[0];
        rest_.remove_prefix(1);
        return stray;
    }
    rest_.remove_prefix(static_cast<std::size_t>(used));
    return static_cast<char32_t>(codePoint);
}

char32_t FoldedCodePoints::Next() {
    if (pendingNext_ < pendingCount_) {
        return pending_[pendingNext_++];
    }
    if (rest_.empty()) {
        return kEnd;
    }
    const auto first = static_cast<unsigned char>(rest_.front());
    if (first < kAsciiEnd) {
        rest_.remove_prefix(1);
        return FoldAscii(first);
    }
    const char32_t codePoint = Decode();
    if (codePoint >= kFirstAfterUnicode) {
        return codePoint;
    }
    utf8proc_int32_t folded[kMaxFolding] = {};
    const utf8proc_ssize_t count = utf8proc_decompose_char(
        static_cast<utf8proc_int32_t>(codePoint), folded, kMaxFolding, UTF8PROC_CASEFOLD, nullptr);
    if (count < 1 || count > kMaxFolding) {
        return codePoint;
    }
    pendingCount_ = static_cast<int>(count);
    for (int i = 0; i < pendingCount_; ++i) {
        pending_[i] = static_cast<char32_t>(folded[i]);
    }
    pendingNext_ = 1;
    return pending_[0];
}

std::u32string CaseFoldKey(std::string_view text) {
    std::u32string key;
    key.reserve(text.size());
    FoldedCodePoints points(text);
    for (char32_t point = points.Next(); point != FoldedCodePoints::kEnd; point = points.Next()) {
        key.push_back(point);
    }
    return key;
}

} // namespace VANO::PLATFORM

// Orders by the folded code points; of two texts one of which goes on where the other ends, the
// shorter is first. Texts that fold to the same code points are equal, so this is a strict weak
// order. A null pointer comes before every text.
int VLIBCUnicodeUTF8StrCaseCmp(const char *a, const char *b) {
    using VANO::PLATFORM::FoldedCodePoints;
    if (a == nullptr || b == nullptr) {
        return (a != nullptr ? 1 : 0) - (b != nullptr ? 1 : 0);
    }
    FoldedCodePoints left(a);
    FoldedCodePoints right(b);
    for (;;) {
        const char32_t x = left.Next();
        const char32_t y = right.Next();
        if (x == y) {
            if (x == FoldedCodePoints::kEnd) {
                return 0;
            }
            continue;
        }
        if (x == FoldedCodePoints::kEnd || y == FoldedCodePoints::kEnd) {
            return x == FoldedCodePoints::kEnd ? -1 : 1;
        }
        return x < y ? -1 : 1;
    }
}
