// Replaces one line by its number.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

extern "C" int TLIBFileSetLine(const char *szPath, int lineNo, const char *szLine)
{
    if (!szPath || lineNo < 1 || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> line = tavo::OneLine(szLine);
        if (!line)
            return Fail(ERR_BAD_PARAMETERS);
        return tavo::RewriteText(szPath, tavo::Missing::fail, [&](std::string_view text) -> std::optional<std::string> {
            const std::optional<tavo::LineSpan> span = tavo::LineByNumber(text, lineNo);
            if (!span)
                return std::nullopt;
            return tavo::WithLine(text, *span, *line);
        });
    });
}
