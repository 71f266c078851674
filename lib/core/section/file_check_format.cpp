// Checks a line format before a section is written with it.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_format.h"

namespace {

bool InOrder(std::string_view format)
{
    for (const std::string_view piece : {"%s", "=", "%s", "\n"}) {
        const size_t at = format.find(piece);
        if (at == format.npos)
            return false;
        format.remove_prefix(at + piece.size());
    }
    return true;
}

}  // namespace

extern "C" int TLIBIFileCheckFormat(const char *szFormat)
{
    if (!szFormat)
        return 0;
    return Guard(
        [&] { return InOrder(szFormat) && tavo::FormatLine(szFormat, "", "") ? 0 : Fail(ERR_BAD_PARAMETERS); });
}
