// Reads a line of pvs.
#include "tavo_lvm.h"

#include "storage/detail/lvm_line.h"

extern "C" int LVMPvParseLine(const char *szLine, LVMPV *pPv)
{
    const std::optional<LVMPV> pv = szLine && pPv ? tavo::ParsePvLine(szLine) : std::nullopt;
    if (!pv)
        return -1;
    *pPv = *pv;
    return 0;
}
