// Cuts the next token off a text, also an empty one.
#include "tavo_str.h"

#include <cstring>

extern "C" char *TLIBStrSep(char **ppCursor, const char *szDelimiters)
{
    return ppCursor && szDelimiters ? ::strsep(ppCursor, szDelimiters) : nullptr;
}
