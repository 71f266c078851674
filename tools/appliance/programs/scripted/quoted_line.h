// One argument vector as one line of text, reversible and readable: plain words are unchanged, any other is written as
// the shell's $'...'. Two vectors are equal when their lines are.
#ifndef TOOLS_APPLIANCE_QUOTED_LINE_H
#define TOOLS_APPLIANCE_QUOTED_LINE_H

#include <string>
#include <string_view>
#include <vector>

namespace scenario {

inline std::string QuotedWord(std::string_view word)
{
    constexpr std::string_view plain = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_@%+=:,./-";
    if (!word.empty() && word.find_first_not_of(plain) == std::string_view::npos)
        return std::string(word);
    constexpr char hex[] = "0123456789abcdef";
    std::string text = "$'";
    for (const char c : word) {
        const unsigned char byte = static_cast<unsigned char>(c);
        if (c == '\'' || c == '\\')
            text += {'\\', c};
        else if (c == '\n')
            text += "\\n";
        else if (c == '\t')
            text += "\\t";
        else if (byte < ' ' || byte > '~')
            text += {'\\', 'x', hex[byte >> 4], hex[byte & 15]};
        else
            text += c;
    }
    return text + "'";
}

inline std::string QuotedLine(const std::vector<std::string> &words)
{
    std::string line;
    for (const std::string &word : words)
        line += (line.empty() ? "" : " ") + QuotedWord(word);
    return line;
}

}  // namespace scenario

#endif
