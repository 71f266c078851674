// Counts the characters of a UTF-8 text.
#include "tavo_str.h"

#include "core/detail/fault.h"
#include "core/detail/folded_text.h"

extern "C" int TLIBUnicodeUTF8StrCountChar(const char *sz)
{
    const int count = sz ? tavo::CountCodePoints(sz) : -1;
    return count < 0 ? Fail(ERR_BAD_PARAMETERS) : count;
}
