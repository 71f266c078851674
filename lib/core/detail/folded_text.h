// UTF-8 text without regard to case: full case folding, one character after the other, so that no length needs memory
// and a comparison can only fail for text that is not UTF-8.
#ifndef TAVO_CORE_DETAIL_FOLDED_TEXT_H
#define TAVO_CORE_DETAIL_FOLDED_TEXT_H

namespace tavo {

// -1, 0 or 1; -2 when one of them is not UTF-8, wherever in the text, or cannot be folded.
int CompareFolded(const char *left, const char *right) noexcept;

// The order for sorting, total for all byte strings: text that is not UTF-8 behind all other, by bytes.
int OrderFolded(const char *left, const char *right) noexcept;

// False when the text is not ASCII and Unicode's tables cannot be loaded: comparing it would give -2 although it may be
// UTF-8.
bool CanFold(const char *text) noexcept;

// The number of code points; -1 when the text is not UTF-8 or longer than an int counts.
int CountCodePoints(const char *text) noexcept;

}  // namespace tavo

#endif
