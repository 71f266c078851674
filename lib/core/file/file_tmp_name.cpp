// Composes a temporary name from the process id and a counter.
#include "tavo_file.h"

#include "core/detail/fault.h"

#include <cstdio>
#include <cstring>

#include <unistd.h>

namespace {

constinit int names_made = 0;

}  // namespace

extern "C" int TLIBFileITmpName(const char *szPrefix, char *szBuf, int cbBuf)
{
    if (!szPrefix || !szBuf || cbBuf < 0)
        return Fail(ERR_BAD_PARAMETERS, Line{40});
    char ending[32];
    std::snprintf(ending, sizeof ending, "%d-%d", static_cast<int>(::getpid()), names_made++);
    const size_t prefix = std::strlen(szPrefix), whole = prefix + std::strlen(ending);
    if (whole >= static_cast<size_t>(cbBuf))
        return Fail(ERR_BAD_PARAMETERS, Line{50});
    std::memmove(szBuf, szPrefix, prefix);  // callers build a name in the buffer that holds its prefix
    std::strcpy(szBuf + prefix, ending);
    return 0;
}
