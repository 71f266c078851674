// Lines and blank-separated fields of kernel files and tool outputs.
#ifndef TAVO_CORE_DETAIL_TEXT_FIELDS_H
#define TAVO_CORE_DETAIL_TEXT_FIELDS_H

#include <string_view>
#include <vector>

namespace tavo {

// Takes the first line, without its newline, off the text.
inline std::string_view TakeLine(std::string_view &text)
{
    const size_t newline = text.find('\n');
    const std::string_view line = text.substr(0, newline);
    text.remove_prefix(newline == std::string_view::npos ? text.size() : newline + 1);
    return line;
}

// The text without the bytes of `blanks` at both ends.
inline std::string_view Trimmed(std::string_view text, std::string_view blanks = " \t\r\n")
{
    const size_t begin = text.find_first_not_of(blanks);
    return begin == text.npos ? std::string_view() : text.substr(begin, text.find_last_not_of(blanks) + 1 - begin);
}

inline std::vector<std::string_view> SplitFields(std::string_view line)
{
    constexpr std::string_view blanks = " \t\r\n";
    std::vector<std::string_view> fields;
    for (;;) {
        const size_t begin = line.find_first_not_of(blanks);
        if (begin == std::string_view::npos)
            return fields;
        line.remove_prefix(begin);
        const size_t end = line.find_first_of(blanks);
        fields.push_back(line.substr(0, end));
        line.remove_prefix(end == std::string_view::npos ? line.size() : end);
    }
}

}  // namespace tavo

#endif
