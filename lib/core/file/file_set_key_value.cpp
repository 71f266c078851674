// Sets one key by a safe rewrite.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_format.h"
#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

extern "C" int TLIBFileSetKeyValue(const char *szPath, const char *szKey, const char *szValue, const char *szFormat)
{
    if (!szPath || !szKey || !szValue || !tavo::IsWritableKey(szKey) || !tavo::IsWritableValue(szValue))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> line = tavo::FormatLine(szFormat, szKey, szValue);
        if (!line)
            return Fail(ERR_BAD_PARAMETERS);
        return tavo::RewriteText(szPath, tavo::Missing::create, [&](std::string_view text) {
            return std::optional(tavo::WithKey(text, szKey, *line));
        });
    });
}
