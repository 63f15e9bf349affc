#ifndef VANO_PLATFORM_CASE_FOLD_H
#define VANO_PLATFORM_CASE_FOLD_H

#include <string>
#include <string_view>

namespace VANO::PLATFORM {

// The code points of a UTF-8 text, one after another, each replaced by its full Unicode case
// folding (one code point to three). Nothing is normalised. The foldings are those of utf8proc: a
// small library that follows each Unicode release, needs no locale and allocates nothing for them.
//
// A byte that belongs to no valid sequence counts as a code point of its own behind all valid ones,
// so that any two byte strings can be compared and no two different invalid bytes are equal.
class FoldedCodePoints {
  public:
    explicit FoldedCodePoints(std::string_view text) : rest_(text) {}

    static constexpr char32_t kEnd = 0xFFFFFFFF;

    // The next folded code point, kEnd after the last.
    char32_t Next();

  private:
    static constexpr int kMaxFolding = 4;

    char32_t Decode();

    std::string_view rest_;
    char32_t pending_[kMaxFolding] = {};
    int pendingCount_ = 0;
    int pendingNext_ = 0;
};

// A key that is equal for exactly the texts that VLIBCUnicodeUTF8StrCaseCmp() calls equal.
std::u32string CaseFoldKey(std::string_view text);

} // namespace VANO::PLATFORM

#endif
