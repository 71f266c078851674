// Splits the lines of a settings file.
#include "core/detail/key_value_line.h"

namespace tavo {
namespace {

// The first non-empty token and the text after its delimiter; a missing rest has no data.
struct Token {
    std::string_view text;
    std::string_view rest;
};

Token FirstToken(std::string_view line, std::string_view delimiters)
{
    const size_t begin = line.find_first_not_of(delimiters);
    if (begin == line.npos)
        return {};
    line.remove_prefix(begin);
    const size_t end = line.find_first_of(delimiters);
    if (end == line.npos)
        return {line, {}};
    const std::string_view token = line.substr(0, end);
    line.remove_prefix(end + 1);
    return {token, line};
}

}  // namespace

std::string_view TrimSetting(std::string_view text)
{
    while (!text.empty() && IsWhiteSpace(text.front()))
        text.remove_prefix(1);
    while (!text.empty() && IsWhiteSpace(text.back()))
        text.remove_suffix(1);
    if (text.size() >= 2 && text.front() == '"' && text.back() == '"')
        text = text.substr(1, text.size() - 2);
    return text;
}

std::string_view LineKey(std::string_view line)
{
    if (IsCommentLine(line) || line.find('=') == line.npos)
        return {};
    return TrimSetting(FirstToken(line, "=").text);
}

std::string_view LineValue(std::string_view line)
{
    return TrimSetting(UpToNul(FirstToken(FirstToken(line, "=").rest, "\n").text));
}

std::optional<KeyValue> SplitLine(std::string_view line, std::string_view separators)
{
    if (IsCommentLine(line))
        return std::nullopt;
    const Token key = FirstToken(UpToNul(line), separators);
    const Token value = FirstToken(key.rest, "\n");
    const KeyValue pair{TrimSetting(key.text), TrimSetting(value.text)};
    if (pair.key.empty() || value.text.empty())
        return std::nullopt;
    return pair;
}

std::optional<KeyValue> SplitAtEqualSign(std::string_view line)
{
    line = UpToNul(line);
    const size_t sign = line.find('=');
    if (IsCommentLine(line) || sign == line.npos)
        return std::nullopt;
    const KeyValue pair{TrimSetting(line.substr(0, sign)), TrimSetting(line.substr(sign + 1))};
    if (pair.key.empty())
        return std::nullopt;
    return pair;
}

bool IsWritableKey(std::string_view key)
{
    return !key.empty() && TrimSetting(key) == key && !IsCommentLine(key) && !key.starts_with('[') &&
           key.find('=') == key.npos && IsWritableValue(key);
}

bool IsWritableValue(std::string_view value)
{
    return value.find_first_of("\n\r") == value.npos;
}

}  // namespace tavo
