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
        tavo::FoundLine line;
        const auto which = (flags & 1) != 0 ? tavo::Match::last : tavo::Match::first;
        const int code = tavo::FindLineByKey(szPath, szKey, which, line);
        if (code == ERR_OPEN_FAILED)
            return Fail(code, Line{56});
        if (code == ERR_KEY_NOT_FOUND)
            return static_cast<int>(FailZero(code, Line{108}));
        if (code)
            return Fail(code);
        const int length = tavo::CopyOut(tavo::LineValue(line.text), szBuf, cbBuf);
        if (szBuf && length > cbBuf)
            return Fail(ERR_NOT_ENOUGH_MEMORY, Line{88});
        return length;
    });
}
