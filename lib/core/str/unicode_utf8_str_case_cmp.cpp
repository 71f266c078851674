// Compares two UTF-8 texts without regard to case.
#include "tavo_str.h"

#include "core/detail/fault.h"
#include "core/detail/folded_text.h"

extern "C" int TLIBUnicodeUTF8StrCaseCmp(const char *szLeft, const char *szRight)
{
    const int order = szLeft && szRight ? tavo::CompareFolded(szLeft, szRight) : -2;
    if (order == -2)
        Fail(ERR_BAD_PARAMETERS);
    return order;
}
