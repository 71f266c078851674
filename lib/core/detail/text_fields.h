// Lines and fields of settings files, kernel files and tool outputs.
#ifndef TAVO_CORE_DETAIL_TEXT_FIELDS_H
#define TAVO_CORE_DETAIL_TEXT_FIELDS_H

#include <string_view>
#include <vector>

namespace tavo {

// Takes what comes before the first separator off the text, and the separator.
inline std::string_view TakeUntil(std::string_view &text, char separator)
{
    const size_t end = text.find(separator);
    const std::string_view part = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    return part;
}

inline std::string_view TakeLine(std::string_view &text)
{
    return TakeUntil(text, '\n');
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
