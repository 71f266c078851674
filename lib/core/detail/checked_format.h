// A printf-like format that the compiler compares with its arguments: a call whose arguments do not fit does not
// compile.
#ifndef TAVO_CORE_DETAIL_CHECKED_FORMAT_H
#define TAVO_CORE_DETAIL_CHECKED_FORMAT_H

#include "core/detail/result.h"

#include <string_view>
#include <type_traits>

namespace tavo {

enum class ArgKind { text, number };

// Numbers are integers, enumerators and codes; everything else that a format takes is text.
template <class Arg>
inline constexpr ArgKind kArgKind =
    std::is_integral_v<Arg> || std::is_enum_v<Arg> || std::is_same_v<Arg, Code> ? ArgKind::number : ArgKind::text;

// The compiler names these when a format does not fit: they are not constexpr, so reaching one ends the compilation.
void FormatHasMoreConversionsThanArguments();
void FormatHasFewerConversionsThanArguments();
void FormatHasAnUnknownConversion();
void TextConversionNeedsTextAndNumberConversionNeedsANumber();

// %s takes text, %c too; %d, %i, %u, %x and %X take numbers, with a zero flag, a width and length modifiers; %% takes
// nothing.
consteval void CheckFormat(std::string_view format, const ArgKind *kinds, size_t count)
{
    size_t used = 0;
    for (size_t at = 0; at < format.size(); ++at) {
        if (format[at] != '%')
            continue;
        ++at;
        while (at < format.size() && std::string_view("0123456789hljzt").find(format[at]) != std::string_view::npos)
            ++at;
        if (at < format.size() && format[at] == '%')
            continue;
        if (at == format.size() || std::string_view("scdiuxX").find(format[at]) == std::string_view::npos)
            FormatHasAnUnknownConversion();
        if (used == count)
            FormatHasMoreConversionsThanArguments();
        const ArgKind kind = kinds[used++];
        if (format[at] != 'c' && (format[at] == 's') != (kind == ArgKind::text))
            TextConversionNeedsTextAndNumberConversionNeedsANumber();
    }
    if (used != count)
        FormatHasFewerConversionsThanArguments();
}

template <ArgKind... kinds>
class CheckedFormat {
  public:
    template <class Text>
    requires std::is_convertible_v<const Text &, const char *>
    consteval CheckedFormat(const Text &text) : text_(text)
    {
        constexpr ArgKind in_order[] = {kinds..., ArgKind::text};  // one more, because an array is never empty
        CheckFormat(text_, in_order, sizeof...(kinds));
    }

    constexpr const char *Text() const noexcept { return text_; }

  private:
    const char *text_;
};

// The parameter type of a format for these arguments.
template <class... Args>
using FormatFor = CheckedFormat<kArgKind<Args>...>;

}  // namespace tavo

#endif
