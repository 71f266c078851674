// Numbers in texts.
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

// The same for a place that has a variable already, which is zero then.
template <class Number>
bool ReadNumber(std::string_view text, Number &number, int base = 10)
{
    const auto read = StrictNumber<Number>(text, base);
    number = read.value_or(0);
    return read.has_value();
}

// The number that a text begins with; `otherwise` where there is none or it does not fit.
template <class Number>
Number LeadingNumber(std::string_view text, Number otherwise = 0, int base = 10) noexcept
{
    std::from_chars(text.data(), text.data() + text.size(), otherwise, base);
    return otherwise;
}

}  // namespace tavo

#endif
