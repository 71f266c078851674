// UTF-8 text without regard to case.
#include "core/detail/folded_text.h"

#include "core/detail/extras.h"

#include <unicode/utf8.h>

#include <climits>
#include <cstring>

namespace tavo {
namespace {

constexpr bool IsAscii(char byte)
{
    return static_cast<unsigned char>(byte) < 0x80;
}

constexpr int32_t FoldAscii(char byte)
{
    return byte >= 'A' && byte <= 'Z' ? byte + ('a' - 'A') : byte;
}

// ICU's macro needs nothing from its library; its narrowing conversions are masked first.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wconversion"
// Reads the code point at `at` and advances; negative when the bytes are not UTF-8.
int32_t NextCodePoint(const char *&at)
{
    int32_t code_point;
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
    int32_t Next()
    {
        if (pending_ < pending_end_)
            return folded_[pending_++];
        if (IsAscii(*at_))
            return *at_ ? FoldAscii(*at_++) : 0;
        const int32_t code_point = NextCodePoint(at_);
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
    // Few characters fold to more than one; the others wait in the buffer.
    int32_t Fold(int32_t code_point)
    {
        const Extras *extras = LoadExtras();
        if (!extras)
            return -1;
        pending_end_ = extras->fold(code_point, folded_, kMostFolded);
        pending_ = 1;
        return folded_[0];
    }

    const char *at_;
    int32_t folded_[kMostFolded];
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
    int32_t left_char;
    int32_t right_char;
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

bool CanFold(const char *text) noexcept
{
    while (*text && IsAscii(*text))
        ++text;
    return !*text || LoadExtras();
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
