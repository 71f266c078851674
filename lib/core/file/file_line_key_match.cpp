// Checks whether a line sets a key.
#include "tavo_file.h"

#include "core/detail/fault.h"
#include "core/detail/key_value_line.h"

extern "C" int TLIBILineKeyMatch(const char *szLine, const char *szKey)
{
    if (!szLine || !szKey)
        return FailZero(ERR_BAD_PARAMETERS);
    return tavo::LineSetsKey(szLine, szKey);
}
