// Writes the caller's pid file.
#include "tavo_proc.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"
#include "core/detail/trusted_file.h"

#include <string>

extern "C" int TAVOProcPidFileCreate(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Fd fd = tavo::OpenTrustedRegular(szPath, O_WRONLY | O_CREAT);
        struct stat st;
        if (!fd || ::fstat(fd.Get(), &st) != 0)
            return Fail(ERR_OPEN_FAILED);
        // A pid file that others may write to is not trusted.
        if ((st.st_mode & tavo::kWritableByOthers) != 0)
            ::fchmod(fd.Get(), st.st_mode & tavo::kPermissions & ~tavo::kWritableByOthers);
        // Overwrites the old text and cuts the file afterwards: a reader always finds a whole first line, old or new.
        const std::string text = std::to_string(::getpid()) + "\n";
        if (!tavo::WriteAll(fd.Get(), text) || ::ftruncate(fd.Get(), static_cast<off_t>(text.size())) != 0 ||
            !fd.Close())
            return Fail(ERR_WRITE_FAILED);
        return 0;
    });
}
