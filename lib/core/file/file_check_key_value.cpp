// Checks whether a file sets a key to a value.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_search.h"

extern "C" int BlTAVOFileCheckKeyValue(const char *szPath, const char *szKey, const char *szValue)
{
    if (!szPath || !szKey || !szValue)
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByKey(szPath, szKey, tavo::Match::first);
        return line ? tavo::LineValue(line->text) == szValue : FailZero(line.Failure());
    });
}
