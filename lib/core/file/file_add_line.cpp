// Inserts a line by its number.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

namespace {

std::optional<std::string> WithNewLine(std::string_view text, int number, std::string_view line)
{
    if (number == 0) {
        std::string changed(text);
        tavo::AppendLine(changed, line);
        return changed;
    }
    const std::optional<tavo::LineSpan> span = tavo::LineByNumber(text, number);
    if (!span)
        return std::nullopt;
    return tavo::WithLine(text, {span->begin, 0}, line);
}

}  // namespace

extern "C" int TLIBFileAddLine(const char *szPath, int lineNo, const char *szLine)
{
    if (!szPath || lineNo < 0 || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> line = tavo::OneLine(szLine);
        if (!line)
            return Fail(ERR_BAD_PARAMETERS);
        return tavo::RewriteText(szPath, tavo::Missing::fail,
                                 [&](std::string_view text) { return WithNewLine(text, lineNo, *line); });
    });
}
