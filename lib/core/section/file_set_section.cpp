// Replaces the pairs of a section.
#include "tavo_section.h"

#include "core/detail/fault.h"

extern "C" int ErrTLIBFileSetSection(const char *szPath, const char *szSection, const char *szNewName,
                                     const TLIBSZHASH *pshPairs, int flags, const char *szFormat)
{
    if (!pshPairs)
        return Fail(ERR_BAD_PARAMETERS, Line{42});
    return TLIBIFileModifySection(szPath, szSection, szNewName, pshPairs, flags, szFormat);
}
