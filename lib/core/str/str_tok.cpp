// Cuts the next non-empty token off a text.
#include "tavo_str.h"

#include <cstring>

extern "C" char *TLIBIStrTok(char **ppCursor, const char *szDelimiters)
{
    if (!ppCursor || !szDelimiters)
        return nullptr;
    char *token;
    do {
        token = ::strsep(ppCursor, szDelimiters);
    } while (token && !*token);
    return token;
}

extern "C" char *TLIBStrTok(char **ppCursor, const char *szDelimiters)
{
    return TLIBIStrTok(ppCursor, szDelimiters);
}
