// Checks a line format before a section is written with it.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_format.h"

#include <iterator>

namespace {

// Reads conversion by conversion: the end of a "%%" and an "s" after it are not a "%s".
bool InOrder(std::string_view format)
{
    constexpr std::string_view pieces[] = {"%s", "=", "%s", "\n"};
    size_t found = 0;
    while (!format.empty() && found < std::size(pieces)) {
        const std::string_view piece = format.substr(0, format.front() == '%' ? 2 : 1);
        found += piece == pieces[found];
        format.remove_prefix(piece.size());
    }
    return found == std::size(pieces);
}

}  // namespace

extern "C" int TLIBIFileCheckFormat(const char *szFormat)
{
    if (!szFormat)
        return 0;
    return Guard(
        [&] { return InOrder(szFormat) && tavo::FormatLine(szFormat, "", "") ? 0 : Fail(ERR_BAD_PARAMETERS); });
}
