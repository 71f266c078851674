// Creates an empty file unless it exists.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/trusted_file.h"

extern "C" int TLIBFileTouch(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] { return tavo::OpenTrustedRegular(szPath, O_RDONLY | O_CREAT) ? 0 : Fail(ERR_OPEN_FAILED); });
}
