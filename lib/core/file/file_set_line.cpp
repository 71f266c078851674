// Replaces one line by its number.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

extern "C" int TLIBFileSetLine(const char *szPath, int lineNo, const char *szLine)
{
    if (!szPath || lineNo < 1 || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::RewriteWithLine(szPath, szLine, [&](std::string_view text, std::string_view line) {
        return tavo::WithLine(text, tavo::LineByNumber(text, lineNo), line);
    });
}
