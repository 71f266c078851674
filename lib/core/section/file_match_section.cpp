// Checks whether a line is the header of a given section.
#include "tavo_section.h"

#include "core/detail/fault.h"
#include "core/detail/section_header.h"

#include <cstring>

extern "C" int TLIBIFileMatchSection(const char *szLine, int length, const char *szSection)
{
    if (!szLine || !szSection)
        return Fail(ERR_BAD_PARAMETERS, Line{33});
    return length > 0 && tavo::HeadsSection({szLine, ::strnlen(szLine, static_cast<size_t>(length))}, szSection);
}
