// Reads one line by its number.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileGetLine(const char *szPath, int lineNo, char *szBuf, int cbBuf)
{
    if (!szPath || lineNo < 1 || (cbBuf != 0 && !szBuf))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FoundLine line;
        const int code = tavo::FindLineByNumber(szPath, lineNo, line);
        if (code == ERR_KEY_NOT_FOUND)
            return static_cast<int>(FailZero(code));
        if (code)
            return Fail(code);
        const int length = tavo::CopyOut(line.text, szBuf, cbBuf);
        return szBuf && length > cbBuf ? Fail(ERR_NOT_ENOUGH_MEMORY) : length;
    });
}
