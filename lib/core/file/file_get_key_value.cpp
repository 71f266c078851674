// Reads the value of one key.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_search.h"

extern "C" int TLIBFileGetKeyValue(const char *szPath, const char *szKey, char *szBuf, int cbBuf, int flags)
{
    if (!szPath || !szKey || flags < 0 || (cbBuf != 0 && !szBuf))
        return Fail(ERR_BAD_PARAMETERS, Line{52});
    return Guard([&] {
        const auto which = (flags & 1) != 0 ? tavo::Match::last : tavo::Match::first;
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByKey(szPath, szKey, which);
        if (line.Failure() == ERR_OPEN_FAILED)
            return Fail(ERR_OPEN_FAILED, Line{56});
        if (line.Failure() == ERR_KEY_NOT_FOUND)
            return FailNone(ERR_KEY_NOT_FOUND, Line{108});
        if (!line)
            return Fail(line.Failure());
        const int length = tavo::CopyOut(tavo::LineValue(line->text), szBuf, cbBuf);
        if (szBuf && length > cbBuf)
            return Fail(ERR_NOT_ENOUGH_MEMORY, Line{88});
        return length;
    });
}
