// Empties a log file.
#include "tavo_error.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"
#include "core/detail/trusted_file.h"

extern "C" void TLIBErrLogInitial(const char *szPath)
{
    if (!szPath)
        return;
    tavo::GuardSilently(
        [&] {
            const tavo::Fd fd = tavo::OpenTrusted(szPath, O_WRONLY | O_CREAT | O_TRUNC);
            return fd && tavo::SyncFd(fd.Get());
        },
        false);
}
