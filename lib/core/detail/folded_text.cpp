// UTF-8 text without regard to case.
#include "core/detail/folded_text.h"

#include <climits>
#include <cstring>

#include <unicode/uchar.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

namespace tavo {
namespace {

constexpr bool IsAscii(char byte)
{
    return static_cast<unsigned char>(byte) < 0x80;
}

constexpr UChar32 FoldAscii(char byte)
{
    return byte >= 'A' && byte <= 'Z' ? byte + ('a' - 'A') : byte;
}

// ICU's macro narrows where it has masked.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wconversion"
// The code point at `at`, which moves behind it; negative when the bytes are not UTF-8.
UChar32 NextCodePoint(const char *&at)
{
    UChar32 code_point;
    int32_t length = 0;
    U8_NEXT(at, length, -1, code_point);
    at += length;
    return code_point;
}
#pragma GCC diagnostic pop

// Reads a text as the code points of its folded form.
class FoldedCursor {
  public:
    explicit FoldedCursor(const char *text) : at_(text) {}

    // The next code point, 0 at the end, negative where the text is not UTF-8.
    UChar32 Next()
    {
        if (pending_ < pending_end_) {
            UChar32 code_point;
            U16_NEXT_UNSAFE(folded_, pending_, code_point);
            return code_point;
        }
        if (IsAscii(*at_))
            return *at_ ? FoldAscii(*at_++) : 0;
        const UChar32 code_point = NextCodePoint(at_);
        return code_point < 0 ? code_point : Fold(code_point);
    }

    bool RestIsUtf8()
    {
        while (*at_) {
            if (IsAscii(*at_))
                ++at_;
            else if (NextCodePoint(at_) < 0)
                return false;
        }
        return true;
    }

  private:
    // Few characters fold to more than one; those go through the buffer.
    UChar32 Fold(UChar32 code_point)
    {
        UChar source[2];
        int32_t length = 0;
        U16_APPEND_UNSAFE(source, length, code_point);
        UErrorCode error = U_ZERO_ERROR;
        const int32_t folded = u_strFoldCase(folded_, kFoldedMost, source, length, U_FOLD_CASE_DEFAULT, &error);
        if (U_FAILURE(error) || folded < 1)
            return u_foldCase(code_point, U_FOLD_CASE_DEFAULT);
        pending_ = 0;
        pending_end_ = folded;
        UChar32 first;
        U16_NEXT_UNSAFE(folded_, pending_, first);
        return first;
    }

    static constexpr int32_t kFoldedMost = 32;

    const char *at_;
    UChar folded_[kFoldedMost];
    int32_t pending_ = 0;
    int32_t pending_end_ = 0;
};

}  // namespace

int CompareFolded(const char *left, const char *right) noexcept
{
    while (*left && IsAscii(*left) && IsAscii(*right) && FoldAscii(*left) == FoldAscii(*right)) {
        ++left;
        ++right;
    }
    FoldedCursor left_cursor(left);
    FoldedCursor right_cursor(right);
    UChar32 left_char;
    UChar32 right_char;
    do {
        left_char = left_cursor.Next();
        right_char = right_cursor.Next();
    } while (left_char == right_char && left_char > 0);
    if (left_char < 0 || right_char < 0 || !left_cursor.RestIsUtf8() || !right_cursor.RestIsUtf8())
        return -2;
    return left_char < right_char ? -1 : left_char > right_char;
}

int OrderFolded(const char *left, const char *right) noexcept
{
    const int order = CompareFolded(left, right);
    if (order != -2)
        return order;
    const bool left_is_text = FoldedCursor(left).RestIsUtf8();
    const bool right_is_text = FoldedCursor(right).RestIsUtf8();
    if (left_is_text != right_is_text)
        return left_is_text ? -1 : 1;
    return std::strcmp(left, right);
}

int CountCodePoints(const char *text) noexcept
{
    int count = 0;
    for (; *text; ++count) {
        if (NextCodePoint(text) < 0 || count == INT_MAX)
            return -1;
    }
    return count;
}

}  // namespace tavo
