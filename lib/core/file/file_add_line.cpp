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
    return tavo::WithLineBefore(text, tavo::LineByNumber(text, number), line);
}

}  // namespace

extern "C" int TLIBFileAddLine(const char *szPath, int lineNo, const char *szLine)
{
    if (!szPath || lineNo < 0 || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::RewriteWithLine(
        szPath, szLine, [&](std::string_view text, std::string_view line) { return WithNewLine(text, lineNo, line); });
}
