// Opens a temporary file of a unique name.
#include "tavo_file.h"

#include "core/detail/fault.h"
#include "core/detail/open_file.h"

extern "C" FILE *TLIBFileTempFileOpen(char *szTemplate)
{
    if (!szTemplate)
        return FailNull(ERR_BAD_PARAMETERS, Line{40});
    tavo::Fd fd(::mkostemp(szTemplate, O_CLOEXEC));
    if (!fd)
        return FailNull(ERR_OPEN_FAILED, Line{45});
    tavo::RestoreMode(fd.Get(), 0600);
    FILE *stream = ::fdopen(fd.Get(), "we");
    if (!stream) {
        ::unlink(szTemplate);
        return FailNull(ERR_OPEN_FAILED, Line{49});
    }
    fd.Release();
    return stream;
}
