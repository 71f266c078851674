// Parses one line of a settings file: which key it sets, and to what. Pure text; a line may carry its newline or not.
#ifndef TAVO_CORE_DETAIL_KEY_VALUE_LINE_H
#define TAVO_CORE_DETAIL_KEY_VALUE_LINE_H

#include <optional>
#include <string_view>

namespace tavo {

inline constexpr std::string_view kWhiteSpace = "\t\n\r ";

constexpr bool IsWhiteSpace(char byte)
{
    return byte == '\t' || byte == '\n' || byte == '\r' || byte == ' ';
}

// Removes white space at both ends, then one pair of double quotes that encloses the rest.
std::string_view TrimSetting(std::string_view text);

// Callers take texts as C strings, which end at a NUL byte.
constexpr std::string_view UpToNul(std::string_view text)
{
    return text.substr(0, text.find('\0'));
}

constexpr bool IsCommentLine(std::string_view line)
{
    return line.starts_with('#') || line.starts_with(';');
}

// Returns the key that a line sets; empty when it sets none. Doubled and leading "=" are skipped for compatibility:
// "=x" sets x.
std::string_view LineKey(std::string_view line);

// Returns the value of a line that sets a key.
std::string_view LineValue(std::string_view line);

// Characters that may precede a key in its line.
constexpr bool IsAroundKey(char byte)
{
    return IsWhiteSpace(byte) || byte == '=' || byte == '"';
}

// Returns whether a line sets the key. Readers ask this of every line of a file; the first byte that may belong to a
// key decides most of them.
inline bool LineSetsKey(std::string_view line, std::string_view key)
{
    if (key.empty())
        return false;
    if (!IsAroundKey(key[0])) {
        size_t at = 0;
        while (at < line.size() && IsAroundKey(line[at]))
            ++at;
        if (at == line.size() || line[at] != key[0] || line.size() - at < key.size() ||
            line[at + key.size() - 1] != key.back())
            return false;
    }
    return LineKey(line) == key;
}

struct KeyValue {
    std::string_view key;
    std::string_view value;
};

// Splits at any of the separators: the first non-empty token is the key, the rest of the line the value, both trimmed.
// Empty for comments and for lines without a key or value.
std::optional<KeyValue> SplitLine(std::string_view line, std::string_view separators);

// Splits at the first "="; the value may be empty. Empty for comments and for lines without a key.
std::optional<KeyValue> SplitAtEqualSign(std::string_view line);

// Returns whether a key can be found again once written, and neither text adds a line.
bool IsWritableKey(std::string_view key);
bool IsWritableValue(std::string_view value);

}  // namespace tavo

#endif
