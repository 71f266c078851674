// UTF-8 text without regard to case: full case folding, one character at a time. It needs no memory, and a comparison
// can only fail for text that is not UTF-8.
#ifndef TAVO_CORE_DETAIL_FOLDED_TEXT_H
#define TAVO_CORE_DETAIL_FOLDED_TEXT_H

namespace tavo {

// -1, 0 or 1; -2 when either text is not UTF-8 (anywhere in it) or cannot be folded.
int CompareFolded(const char *left, const char *right) noexcept;

// The order for sorting, total for all byte strings: non-UTF-8 text sorts last, bytewise.
int OrderFolded(const char *left, const char *right) noexcept;

// False when the text is not ASCII and Unicode's tables cannot be loaded: a comparison would return -2 although the
// text may be UTF-8.
bool CanFold(const char *text) noexcept;

// Counts the code points; -1 when the text is not UTF-8 or has more than an int can count.
int CountCodePoints(const char *text) noexcept;

}  // namespace tavo

#endif
