// Finds the number of the line that sets a key.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileMatchLineNo(const char *szPath, const char *szKey)
{
    if (!szPath || !szKey)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FoundLine line;
        const int code = tavo::FindLineByKey(szPath, szKey, tavo::Match::first, line);
        if (code == ERR_KEY_NOT_FOUND)
            return static_cast<int>(FailZero(code));
        return code ? Fail(code) : line.number;
    });
}
