// Inserts a line before the one that sets a key.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

extern "C" int TLIBFileAddLineByKey(const char *szPath, const char *szKey, const char *szLine)
{
    if (!szPath || !szKey || !szLine)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::RewriteWithLine(szPath, szLine, [&](std::string_view text, std::string_view line) {
        return tavo::WithLineBefore(text, tavo::LineByKey(text, szKey), line);
    });
}
