// Edits a settings file's whole text.
#include "core/detail/settings_text.h"

#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"

#include <utility>

namespace tavo {
namespace {

template <class Wanted>
std::optional<LineSpan> FindSpan(std::string_view text, Wanted &&wanted)
{
    std::string_view rest = text;
    while (!rest.empty()) {
        const size_t begin = text.size() - rest.size();
        const std::string_view line = TakeWholeLine(rest);
        if (wanted(line))
            return LineSpan{begin, line.size()};
    }
    return std::nullopt;
}

}  // namespace

std::optional<LineSpan> LineByNumber(std::string_view text, int number)
{
    return FindSpan(text, [&](std::string_view) { return --number == 0; });
}

std::optional<LineSpan> LineByKey(std::string_view text, std::string_view key)
{
    return FindSpan(text, [&](std::string_view line) { return LineSetsKey(line, key); });
}

std::optional<std::string> WithLine(std::string_view text, std::optional<LineSpan> span, std::string_view line)
{
    if (!span)
        return std::nullopt;
    std::string changed;
    changed.reserve(text.size() + line.size());
    changed += text.substr(0, span->begin);
    changed += line;
    changed += text.substr(span->begin + span->length);
    return changed;
}

std::optional<std::string> WithLineBefore(std::string_view text, std::optional<LineSpan> span, std::string_view line)
{
    if (span)
        span->length = 0;
    return WithLine(text, span, line);
}

void AppendLine(std::string &text, std::string_view line)
{
    if (!text.empty() && text.back() != '\n')
        text += '\n';
    text += line;
}

std::string WithKey(std::string_view text, std::string_view key, std::string_view line)
{
    std::string changed;
    changed.reserve(text.size() + line.size() + 1);
    bool placed = false;
    while (!text.empty()) {
        const std::string_view old = TakeWholeLine(text);
        if (!LineSetsKey(old, key))
            changed += old;
        else if (!std::exchange(placed, true))
            changed += line;
    }
    if (!placed)
        AppendLine(changed, line);
    return changed;
}

std::optional<std::string> OneLine(std::string_view argument)
{
    if (argument.ends_with('\n'))
        argument.remove_suffix(1);
    if (argument.find('\n') != argument.npos)
        return std::nullopt;
    return std::string(argument) + '\n';
}

}  // namespace tavo
