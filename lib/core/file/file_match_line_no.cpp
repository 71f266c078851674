// Finds the number of the line that sets a key.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileMatchLineNo(const char *szPath, const char *szKey)
{
    if (!szPath || !szKey)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByKey(szPath, szKey, tavo::Match::first);
        return line ? line->number : tavo::ReportSearch(line.Failure());
    });
}
