// Text from files and arguments, made safe to look at.
#include "frame/terminal_text.h"

#include <algorithm>
#include <cstdint>

namespace tavoctl {
namespace {

// The length of the UTF-8 character at the beginning of text, and its number; length 0 when there is none.
struct Character {
    std::size_t length;
    uint32_t number;
};

Character First(std::string_view text)
{
    const auto byte = [&](std::size_t i) {
        return static_cast<unsigned char>(text[i]);
    };
    if (byte(0) < 0x80)
        return {1, byte(0)};
    const std::size_t length = byte(0) >= 0xF0 ? 4 : byte(0) >= 0xE0 ? 3 : byte(0) >= 0xC0 ? 2 : 0;
    if (length == 0 || length > text.size())
        return {0, 0};
    uint32_t number = byte(0) & (0x7Fu >> length);
    for (std::size_t i = 1; i < length; ++i) {
        if ((byte(i) & 0xC0) != 0x80)
            return {0, 0};
        number = number << 6 | (byte(i) & 0x3Fu);
    }
    constexpr uint32_t least[] = {0, 0, 0x80, 0x800, 0x10000};
    const bool surrogate = number >= 0xD800 && number <= 0xDFFF;
    if (number < least[length] || number > 0x10FFFF || surrogate)
        return {0, 0};
    return {length, number};
}

bool Harmless(uint32_t number)
{
    if (number < 0x20 || (number >= 0x7F && number < 0xA0))
        return false;
    // Line and paragraph separators, marks and overrides of direction.
    return !((number >= 0x200E && number <= 0x200F) || (number >= 0x2028 && number <= 0x202E) ||
             (number >= 0x2066 && number <= 0x2069));
}

}  // namespace

std::string Printable(std::string_view text, bool keep_lines)
{
    static constexpr char digits[] = "0123456789abcdef";
    std::string printable;
    printable.reserve(text.size());
    while (!text.empty()) {
        const Character character = First(text);
        const std::size_t length = std::max<std::size_t>(character.length, 1);
        const bool kept_line = keep_lines && (text[0] == '\n' || text[0] == '\t');
        if (character.length && (kept_line || Harmless(character.number))) {
            printable += text.substr(0, length);
        } else {
            for (const char c : text.substr(0, length)) {
                const auto byte = static_cast<unsigned char>(c);
                printable += "\\x";
                printable += digits[byte >> 4];
                printable += digits[byte & 0xF];
            }
        }
        text.remove_prefix(length);
    }
    return printable;
}

std::string Joined(const std::vector<std::string> &texts, const char *separator)
{
    std::string joined;
    for (const std::string &text : texts)
        joined += (joined.empty() ? "" : separator) + text;
    return joined;
}

}  // namespace tavoctl
