// Follows the link of a service to its data folder.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>
#include <cstring>
#include <string_view>

#include <sys/stat.h>
#include <unistd.h>

namespace {

std::string_view Parent(std::string_view path)
{
    const size_t slash = path.rfind('/');
    return slash == std::string_view::npos ? "" : path.substr(0, slash == 0 ? 1 : slash);
}

// The directory that holds the target; the database folders are one level deeper.
std::string_view VolumePath(std::string_view target)
{
    const std::string_view holder = Parent(target);
    return target.find("database") == std::string_view::npos ? holder : Parent(holder);
}

bool IsFolder(const char *path)
{
    struct stat st;
    return ::stat(path, &st) == 0 && S_ISDIR(st.st_mode);
}

}  // namespace

extern "C" int TAVOServiceVolumeGetbyLink(const char *szLink, char *szVolume, int cbVolume, char *szPath, int cbPath)
{
    if (!szLink || !*szLink || !szVolume || cbVolume <= 0 || !szPath || cbPath <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    std::memset(szVolume, 0, static_cast<size_t>(cbVolume));
    std::memset(szPath, 0, static_cast<size_t>(cbPath));

    const ssize_t length = ::readlink(szLink, szVolume, static_cast<size_t>(cbVolume));
    if (length < 0 && (errno == ENOENT || errno == ENOTDIR))
        return 0;
    // A target that fills the buffer was cut: it would name another folder.
    if (length < 0 || length == cbVolume) {
        const int why = length < 0 ? errno : ENAMETOOLONG;
        szVolume[cbVolume - 1] = 0;
        LogError("%s(%d)szLinkPath = %s ,link value = %s , errno=%s", szLink, szVolume, std::strerror(why));
        szVolume[0] = 0;
        return Fail(ERR_UNKNOWN);
    }
    const std::string_view path = VolumePath(szVolume);
    if (path.size() < static_cast<size_t>(cbPath))
        std::memcpy(szPath, path.data(), path.size());
    return IsFolder(szLink) ? 1 : 0;  // as the kernel follows it, also from another directory
}
