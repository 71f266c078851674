// Decimal numbers that are nothing but a number.
#ifndef TAVO_STORAGE_DETAIL_STRICT_NUMBER_H
#define TAVO_STORAGE_DETAIL_STRICT_NUMBER_H

#include <charconv>
#include <optional>
#include <string_view>

namespace tavo {

template <class Number>
std::optional<Number> StrictNumber(std::string_view text)
{
    Number number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc{} && end == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

}  // namespace tavo

#endif
