// Creates an empty file unless it exists.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"

extern "C" int TLIBFileTouch(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const int follow = tavo::IsInPublicDirectory(szPath) ? O_NOFOLLOW : 0;
        return tavo::OpenRegular(szPath, O_RDONLY | O_CREAT | follow) ? 0 : Fail(ERR_OPEN_FAILED);
    });
}
