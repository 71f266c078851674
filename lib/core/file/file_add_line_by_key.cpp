// Inserts a line before the one that sets a key.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

extern "C" int TLIBFileAddLineByKey(const char *szPath, const char *szKey, const char *szLine)
{
    if (!szPath || !szKey || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> line = tavo::OneLine(szLine);
        if (!line)
            return Fail(ERR_BAD_PARAMETERS);
        return tavo::RewriteText(szPath, tavo::Missing::fail, [&](std::string_view text) -> std::optional<std::string> {
            const std::optional<tavo::LineSpan> span = tavo::LineByKey(text, szKey);
            if (!span)
                return std::nullopt;
            return tavo::WithLine(text, {span->begin, 0}, *line);
        });
    });
}
