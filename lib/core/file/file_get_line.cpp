// Reads one line by its number.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileGetLine(const char *szPath, int lineNo, char *szBuf, int cbBuf)
{
    if (!szPath || lineNo < 1 || (cbBuf != 0 && !szBuf))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByNumber(szPath, lineNo);
        if (!line)
            return tavo::ReportSearch(line.Failure());
        const int length = tavo::CopyOut(line->text, szBuf, cbBuf);
        return szBuf && length > cbBuf ? Fail(ERR_NOT_ENOUGH_MEMORY) : length;
    });
}
