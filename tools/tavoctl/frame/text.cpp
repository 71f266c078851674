// Text for people: made safe to look at, broken between words, compared with the words that are known.
#include "frame/text.h"

#include <algorithm>
#include <cstdint>
#include <cwchar>
#include <numeric>
#include <sstream>
#include <utility>

namespace tavoctl {
namespace {

// The length of the character at the beginning of text, in the UTF-8 of the program's locale, and its number; length 0
// when there is none.
struct Character {
    std::size_t length;
    uint32_t number;
};

Character First(std::string_view text)
{
    std::mbstate_t state = {};
    wchar_t wide = 0;
    const std::size_t length = std::mbrtowc(&wide, text.data(), text.size(), &state);
    const auto number = static_cast<uint32_t>(wide);
    const bool surrogate = number >= 0xD800 && number <= 0xDFFF;
    return length > text.size() || number > 0x10FFFF || surrogate ? Character{0, 0} : Character{length, number};
}

bool Harmless(uint32_t number)
{
    if (number < 0x20 || (number >= 0x7F && number < 0xA0))
        return false;
    // Line and paragraph separators, marks and overrides of direction.
    return !((number >= 0x200E && number <= 0x200F) || (number >= 0x2028 && number <= 0x202E) ||
             (number >= 0x2066 && number <= 0x2069));
}

constexpr std::size_t line_width = 80;
constexpr std::size_t widest_name = 24;

// Insertions, deletions, replacements and swaps of neighbours.
std::size_t Mistakes(const std::string &from, const std::string &to)
{
    std::vector<std::size_t> before(to.size() + 1), row(to.size() + 1), next(to.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 1; i <= from.size(); ++i) {
        next[0] = i;
        for (std::size_t j = 1; j <= to.size(); ++j) {
            next[j] = std::min({row[j] + 1, next[j - 1] + 1, row[j - 1] + (from[i - 1] != to[j - 1])});
            if (i > 1 && j > 1 && from[i - 1] == to[j - 2] && from[i - 2] == to[j - 1])
                next[j] = std::min(next[j], before[j - 2] + 1);
        }
        before = std::exchange(row, next);
    }
    return row.back();
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

std::vector<std::string> Split(const std::string &text, char separator)
{
    std::vector<std::string> parts;
    std::istringstream in(text);
    for (std::string part; std::getline(in, part, separator);)
        parts.push_back(part);
    return parts;
}

std::string Joined(const std::vector<std::string> &texts, const char *separator)
{
    std::string joined;
    for (const std::string &text : texts)
        joined += (joined.empty() ? "" : separator) + text;
    return joined;
}

std::string Paragraph(const std::string &text, std::size_t indent, std::size_t column)
{
    std::string lines;
    bool begins = true;
    std::istringstream words(text);
    for (std::string word; words >> word; begins = false) {
        const bool breaks = !begins && column + 1 + word.size() > line_width;
        lines += (breaks ? "\n" + std::string(indent, ' ') : begins ? "" : " ") + word;
        column = (breaks ? indent : begins ? column : column + 1) + word.size();
    }
    return lines + "\n";
}

std::string Described(const std::vector<std::pair<std::string, std::string>> &lines)
{
    std::size_t width = 0;
    for (const auto &[name, about] : lines)
        width = std::max(width, std::min(name.size(), widest_name));
    std::string text;
    for (const auto &[name, about] : lines) {
        const std::size_t indent = width + 4;
        text += "  " + name;
        text += name.size() > width ? "\n" + std::string(indent, ' ') : std::string(indent - 2 - name.size(), ' ');
        text += Paragraph(about, indent, indent);
    }
    return text;
}

std::string DidYouMean(const std::string &word, const std::vector<std::string> &known, const std::string &otherwise)
{
    constexpr std::size_t longest = 64;
    std::string best;
    std::size_t fewest = std::max<std::size_t>(2, word.size() / 3) + 1;
    for (const std::string &name : known) {
        if (name.size() > longest || word.size() > longest)
            continue;
        const bool begins = word.size() >= 2 && name.starts_with(word);
        const std::size_t mistakes = begins ? 1 : Mistakes(word, name);
        if (mistakes && mistakes < std::min(fewest, name.size())) {
            fewest = mistakes;
            best = name;
        }
    }
    return best.empty() ? otherwise : "did you mean " + best + "?";
}

}  // namespace tavoctl
