// Points the link of a service's data folder at its target.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>
#include <climits>
#include <cstdio>

#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr const char *kLinkFolder = "/var/services";

bool IsDirectory(const char *path)
{
    struct stat st;
    return ::stat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

// Replaces anything but a folder. The caller's umask applies to the mode, so that the folder is not open to everybody
// unless asked for.
bool MakeLinkFolder()
{
    if (IsDirectory(kLinkFolder))
        return true;
    return (::unlink(kLinkFolder) == 0 || errno == ENOENT) && ::mkdir(kLinkFolder, 0777) == 0;
}

// Only a link is replaced: a folder or a file there is a user's data. The old link stays until the new one exists.
bool ReplaceLink(const char *target, const char *path)
{
    struct stat st;
    if (::lstat(path, &st) != 0)
        return errno == ENOENT && ::symlink(target, path) == 0;
    if (!S_ISLNK(st.st_mode))
        return false;
    char next[PATH_MAX];
    std::snprintf(next, sizeof next, "%s.%d", path, ::getpid());
    ::unlink(next);  // left by a process of that number that died here
    if (::symlink(target, next) != 0)
        return false;
    if (::rename(next, path) == 0)
        return true;
    ::unlink(next);
    return false;
}

}  // namespace

extern "C" int TAVOServiceLinkSet(int idShare, const char *szTarget)
{
    TAVOSERVICESHARE share;

    if (!szTarget || !*szTarget)
        return Fail(ERR_BAD_PARAMETERS);
    if (TAVOServiceSettingGet(idShare, &share) < 0) {
        LogError("%s(%d)[%X] Failed to get service info : id = %d", TLIBErrGet(), idShare);
        return -1;
    }
    if (!MakeLinkFolder()) {
        const int code = errno == ENOSPC ? ERR_NOT_ENOUGH_SPACE : ERR_MKDIR_FAILED;
        LogError("%s(%d)Failed to mkdir : %s", kLinkFolder);
        return Fail(code);
    }
    if (!ReplaceLink(szTarget, share.szLink)) {
        LogError("%s(%d)Failed to create link of %s for share=%s", szTarget, share.szShare);
        return Fail(ERR_MKDIR_FAILED);
    }
    return 0;
}
