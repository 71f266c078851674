// Checks whether a line is a section header.
#include "tavo_section.h"

#include "core/detail/fault.h"
#include "core/detail/section_header.h"

#include <cstring>

extern "C" int TLIBIFileIsSection(const char *szLine, int length)
{
    if (!szLine)
        return FailZero(ERR_BAD_PARAMETERS);
    return length > 0 && tavo::IsSectionHeader({szLine, ::strnlen(szLine, static_cast<size_t>(length))});
}
