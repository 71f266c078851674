// Reads the line that sets a key.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileGetLineByKey(const char *szPath, const char *szKey, char *szBuf, int cbBuf)
{
    if (!szPath || !szKey || (cbBuf != 0 && !szBuf))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByKey(szPath, szKey, tavo::Match::first);
        if (!line)
            return tavo::ReportSearch(line.Failure());
        const int length = tavo::CopyOut(line->text, szBuf, cbBuf);
        return szBuf && length > cbBuf ? Fail(ERR_NOT_ENOUGH_MEMORY) : length;
    });
}
