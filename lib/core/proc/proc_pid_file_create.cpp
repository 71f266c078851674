// Writes the caller's pid file.
#include "tavo_proc.h"

#include "core/detail/guard.h"
#include "core/detail/open_file.h"

#include <string>

namespace {

// In /tmp somebody may have put a link or a file of their own in the way.
tavo::Fd OpenPidFile(const char *path)
{
    const bool is_public = tavo::IsInPublicDirectory(path);
    tavo::Fd fd = tavo::OpenRegular(path, O_WRONLY | O_CREAT | (is_public ? O_NOFOLLOW : 0));
    struct stat st;
    if (fd && is_public && (::fstat(fd.Get(), &st) != 0 || st.st_uid != ::geteuid() || st.st_nlink != 1))
        return tavo::Fd();
    return fd;
}

}  // namespace

extern "C" int TAVOProcPidFileCreate(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::Fd fd = OpenPidFile(szPath);
        if (!fd)
            return Fail(ERR_OPEN_FAILED);
        // Written over the old text and cut afterwards: who reads meanwhile finds a whole first line, old or new.
        const std::string text = std::to_string(::getpid()) + "\n";
        if (!tavo::WriteAll(fd.Get(), text) || ::ftruncate(fd.Get(), static_cast<off_t>(text.size())) != 0 ||
            !fd.Close())
            return Fail(ERR_WRITE_FAILED);
        return 0;
    });
}
