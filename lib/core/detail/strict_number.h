// Numbers: the whole text or nothing.
#ifndef TAVO_CORE_DETAIL_STRICT_NUMBER_H
#define TAVO_CORE_DETAIL_STRICT_NUMBER_H

#include <charconv>
#include <optional>
#include <string_view>

namespace tavo {

// Empty for anything but a number of this type, such as one with blanks or a sign "+" before it.
template <class Number>
std::optional<Number> StrictNumber(std::string_view text, int base = 10)
{
    Number number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    return error == std::errc{} && end == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

}  // namespace tavo

#endif
