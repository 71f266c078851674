// Text: numbers in it, and for people printable, joined, broken between words, and the word that was meant.
#ifndef TAVOCTL_TEXT_H
#define TAVOCTL_TEXT_H

#include <charconv>
#include <concepts>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace tavoctl {

// The text with every byte that a terminal could take for a command as "\xNN": control characters, bytes that are not
// UTF-8, and the invisible characters that change the direction of text. Line feeds too, unless keep_lines.
std::string Printable(std::string_view text, bool keep_lines = false);

// The parts of a text between separators. A separator at its end begins no further part.
std::vector<std::string> Split(const std::string &text, char separator);

// The texts with a separator between them.
std::string Joined(const std::vector<std::string> &texts, const char *separator);

// Broken between words so that no line is longer than a terminal usually is. The first line begins at column, the others after indent blanks.
std::string Paragraph(const std::string &text, std::size_t indent = 0, std::size_t column = 0);

// Names on the left, their meanings on the right.
std::string Described(const std::vector<std::pair<std::string, std::string>> &lines);

// The number that the whole text is; nothing for any other text.
template <std::integral Number>
std::optional<Number> NumberIn(std::string_view text, int base = 10)
{
    Number number = 0;
    const char *const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number, base);
    return error == std::errc() && stop == end ? std::optional(number) : std::nullopt;
}

// Decimal, or hexadecimal after "0x".
template <std::integral Number>
std::optional<Number> AnyNumberIn(std::string_view text)
{
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    return NumberIn<Number>(text.substr(hexadecimal ? 2 : 0), hexadecimal ? 16 : 10);
}

// "did you mean anna?", or the other text when no word is near.
std::string DidYouMean(const std::string &word, const std::vector<std::string> &known, const std::string &otherwise);

}  // namespace tavoctl

#endif
