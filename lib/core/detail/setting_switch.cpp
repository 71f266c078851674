// Reads switches of settings files.
#include "core/detail/setting_switch.h"

#include "tavo_file.h"

#include "core/detail/keep_fault.h"

#include <cerrno>
#include <new>

#include <strings.h>
#include <unistd.h>

namespace tavo {

bool SettingEquals(const char *path, const char *key, const char *value) noexcept
{
    const KeepFault keep;
    return BlTAVOFileCheckKeyValue(path, key, value) != 0;
}

bool SettingIsYes(const char *path, const char *key) noexcept
{
    return SettingEquals(path, key, "yes");
}

bool SettingSaysYes(const char *path, const char *key) noexcept
{
    char value[8];  // a longer value is not a "yes"
    const KeepFault keep;
    return TLIBFileGetKeyValue(path, key, value, sizeof value, 0) > 0 && ::strcasecmp(value, "yes") == 0;
}

std::optional<bool> ReadSetting(const char *path, const char *key, const char *value)
{
    const KeepFault keep;
    tavoerrno = 0;
    errno = 0;
    if (BlTAVOFileCheckKeyValue(path, key, value) != 0)
        return true;
    if (tavoerrno == ERR_OUT_OF_MEMORY)
        throw std::bad_alloc();
    // Settings that are not for other users are, for these, not there. Nothing is closed to root.
    const bool absent = errno == ENOENT || (errno == EACCES && ::geteuid() != 0);
    const bool unreadable = tavoerrno == ERR_READ_FAILED || (tavoerrno == ERR_OPEN_FAILED && !absent);
    return unreadable ? std::nullopt : std::optional(false);
}

}  // namespace tavo
