// The library's error codes with what they mean and what usually helps.
#include "frame/error_codes.h"

#include "tavo_error.h"

#include <algorithm>
#include <cstdio>
#include <iterator>

#include <strings.h>

namespace tavoctl {
namespace {

#define ROW(code, meaning, hint)                                                                                       \
    {                                                                                                                  \
        code, #code, meaning, hint                                                                                     \
    }

// clang-format off
constexpr ErrorCode codes[] = {
    ROW(ERR_SUCCESS,                 "no failure", ""),
    ROW(ERR_NOT_ENOUGH_MEMORY,       "the caller's buffer is too small; nothing was written to it", ""),
    ROW(ERR_OUT_OF_MEMORY,           "an allocation failed; nothing was changed", "free memory and try again"),
    ROW(ERR_ACCESS_DENIED,           "no permission", "run it as root"),
    ROW(ERR_LOCK_FAILED,             "a lock could not be had in time", "another program holds it; try again, or wait longer with --timeout"),
    ROW(ERR_UNLOCK_FAILED,           "a lock could not be released", ""),
    ROW(ERR_PATH_NOT_FOUND,          "a directory on the way is missing", "check the path"),
    ROW(ERR_FILE_NOT_FOUND,          "no such file or device", "check the name"),
    ROW(ERR_FILE_EXISTS,             "the file is there already", ""),
    ROW(ERR_OPEN_FAILED,             "a file could not be opened, or is not a regular file", "check that it is there, is a regular file, and that you may open it"),
    ROW(ERR_READ_FAILED,             "reading failed", "look at the system log"),
    ROW(ERR_WRITE_FAILED,            "writing, syncing or closing failed; the old file is unchanged", "check the free space of its file system"),
    ROW(ERR_CREATE_FAILED,           "a directory could not be created, or another user has one there", "look at who owns /tmp/lock"),
    ROW(ERR_BAD_PARAMETERS,          "an argument was refused; nothing was changed", "check the arguments"),
    ROW(ERR_INVALID_SERVERNAME,      "not a valid name of a server", "check the name"),
    ROW(ERR_INVALID_DOMAINNAME,      "not a valid name of a domain", "check the name"),
    ROW(ERR_INVALID_NETNAME,         "not a valid name of a network or an interface", "check the name"),
    ROW(ERR_SERVER_UNREACHABLE,      "the server does not answer", "check the network and the address"),
    ROW(ERR_INVALID_SHARENAME,       "not a valid name of a shared folder", "check the name"),
    ROW(ERR_SHARE_EXISTS,            "the shared folder is there already", "choose another name"),
    ROW(ERR_NO_SUCH_SHARE,           "no such shared folder", "check the name"),
    ROW(ERR_TOO_MANY_SHARES,         "the model's limit of shared folders is reached", "remove one first"),
    ROW(ERR_INVALID_GROUPNAME,       "not a valid name of a group", "check the name"),
    ROW(ERR_GROUP_EXISTS,            "the group is there already", "choose another name"),
    ROW(ERR_NO_SUCH_GROUP,           "no such group", "check the name"),
    ROW(ERR_TOO_MANY_GROUPS,         "the model's limit of groups is reached", "remove one first"),
    ROW(ERR_INVALID_USERNAME,        "not a valid name of a user", "check the name"),
    ROW(ERR_INVALID_PASSWORDNAME,    "not a valid password", "choose another password"),
    ROW(ERR_USER_EXISTS,             "the user is there already", "choose another name"),
    ROW(ERR_NO_SUCH_USER,            "no such user", "check the name"),
    ROW(ERR_WRONG_PASSWORD,          "the password is wrong", ""),
    ROW(ERR_TOO_MANY_USERS,          "the model's limit of users is reached", "remove one first"),
    ROW(ERR_KEY_NOT_FOUND,           "no such key", "check the spelling; list what is there"),
    ROW(ERR_KEY_EXISTS,              "the key is there already", "set it instead"),
    ROW(ERR_SECTION_NOT_FOUND,       "no such section", "check the spelling; list what is there"),
    ROW(ERR_SECTION_EXISTS,          "the section is there already", "set it instead"),
    ROW(ERR_NOT_ENOUGH_QUOTA,        "the quota does not suffice", "raise the quota"),
    ROW(ERR_NOT_ENOUGH_VOLUME_SPACE, "the volume has too little free space", "free space on it"),
    ROW(ERR_SEEK_FAILED,             "moving in a file or device failed", ""),
    ROW(ERR_STAT_FAILED,             "a file could not be examined", ""),
    ROW(ERR_RENAME_FAILED,           "the new file could not take the old one's place; the old file is unchanged", "check whether its directory may be written to"),
    ROW(ERR_NOT_ENOUGH_SPACE,        "too little free space", "free space"),
    ROW(ERR_OP_FAILURE,              "a program could not be run or did not end normally", "look at the system log"),
    ROW(ERR_DEV_UNCONFIG,            "the device is not configured", ""),
    ROW(ERR_DEV_UNMOUNTED,           "the device is not mounted", ""),
    ROW(ERR_OP_UNREGISTERED,         "there is no such operation", ""),
    ROW(ERR_TIMER_EXPIRED,           "a program outlived its time limit and was killed", "give it more time"),
    ROW(ERR_READ_GEO,                "the geometry of a disk could not be read", "check the disk"),
    ROW(ERR_USAGE,                   "a tool was called wrongly", ""),
    ROW(ERR_UPDATE_OFFSET,           "an update file has a wrong offset", "get the file again"),
    ROW(ERR_CHECKSUM,                "a checksum does not fit", "get the file again"),
    ROW(ERR_OPEN_RAWDEVICE,          "a raw device could not be opened", ""),
    ROW(ERR_OPEN_OPTFILE,            "an option file could not be opened", ""),
    ROW(ERR_READ_RAWDEVICE,          "a raw device could not be read", "check the disk"),
    ROW(ERR_WRITE_RAWDEVICE,         "a raw device could not be written", "check the disk"),
    ROW(ERR_BADPATCH,                "a patch does not fit", ""),
    ROW(ERR_REMOVE_FAILED,           "removing files or directories failed", ""),
    ROW(ERR_MOVE_FAILED,             "moving a directory tree failed", ""),
    ROW(ERR_COPY_FAILED,             "copying files failed", "check the free space"),
    ROW(ERR_MKDIR_FAILED,            "creating a directory or a link failed", "check the free space"),
    ROW(ERR_AUTOBLOCK_MAP,           "mapping the login auto-block database failed", ""),
    ROW(ERR_FORMAT_ERROR,            "text or data has the wrong format", ""),
    ROW(ERR_BACKUP_NOT_FOUND,        "no such backup configuration entry", ""),
    ROW(ERR_BACKUP_DELETE,           "deleting local-backup information failed", ""),
    ROW(ERR_APP_BACKUP,              "an application backup failed", ""),
    ROW(ERR_APP_RESTORE,             "an application restore failed", ""),
    ROW(ERR_NO_VOLUME_ID,            "no such volume", "check the name"),
    ROW(ERR_NO_DISK_ID,              "no such disk", "check the name"),
    ROW(ERR_NOT_ENOUGH_SD,           "too few disks", "add disks, or choose another level"),
    ROW(ERR_SD_SIZE_NOT_ALIGN,       "the disks differ in size", ""),
    ROW(ERR_DEVICE_BUSY,             "the device is in use", "stop what uses it"),
    ROW(ERR_INVALID_SD,              "not a usable disk", "check the disk"),
    ROW(ERR_FORMAT_FAIL,             "making a file system failed", "check the disks"),
    ROW(ERR_CANNOT_REBUILD_DISK,     "the disk cannot take part in a rebuild", "take another disk"),
    ROW(ERR_BROKEN_RAID_CONF,        "the configuration of an array is broken", ""),
    ROW(ERR_DISK_TOO_SMALL,          "the disk is too small", "take a larger disk"),
    ROW(ERR_CANNOT_GET_MNTINFO,      "the mounted file systems could not be read", ""),
    ROW(ERR_BROKEN_DISK_INFO,        "the information about a disk is broken", "check the disk"),
    ROW(ERR_DISK_IO_FAILED,          "a disk reported an error", "check the disk"),
    ROW(ERR_BAD_DISKSECTOR,          "a disk has bad sectors", "replace the disk"),
    ROW(ERR_UDPD_INVALID_HANDLE,     "discovery: no such handle", ""),
    ROW(ERR_UDPD_RUNNING_HANDLE,     "discovery: the handle is in use", ""),
    ROW(ERR_UDPD_INVALID_EVENT,      "discovery: no such event", ""),
    ROW(ERR_UDPD_INVALID_PARAMETER,  "discovery: an argument was refused", "check the arguments"),
    ROW(ERR_UDPD_EXIT_ABNORMAL,      "discovery: it ended early", ""),
    ROW(ERR_UDPD_NOT_ENOUGH_SPACE,   "discovery: a buffer is too small", ""),
    ROW(ERR_UDPD_TIMEOUT,            "discovery: nothing answered in time", "check the network"),
    ROW(ERR_UDPD_INIT_FAIL,          "discovery: the sockets could not be set up", ""),
    ROW(ERR_UDPD_SEND_FAIL,          "discovery: a packet could not be sent", "check the network"),
    ROW(ERR_UDPD_RECV_FAIL,          "discovery: a packet could not be received", ""),
    ROW(ERR_UNKNOWN,                 "an unknown failure", "look at the system log"),
    ROW(ERR_SYS_UNKNOWN,             "the kernel refused for another reason", ""),
    ROW(ERR_VOLUME_SIZE_TOO_LARGE,   "the volume would be too large", "choose a smaller size"),
    ROW(ERR_NO_SERVICE_VOLUME,       "no volume can be chosen for a service", "create a volume first"),
    ROW(ERR_DB_CLOSE,                "closing a database, or moving a share, failed", ""),
    ROW(ERR_YP_BIND,                 "the directory service does not answer", "check the network"),
    ROW(ERR_QUOTA_NOT_ENABLED,       "the volume has no quotas", "enable quotas on it"),
    ROW(ERR_QUOTA_BAD_ARGUMENT,      "the kernel refused a quota argument", "check the arguments"),
    ROW(ERR_QUOTA_REMOUNT,           "remounting a volume with quotas failed", ""),
    ROW(ERR_QUOTA_CHECK,             "building the quota files failed", ""),
    ROW(ERR_QUOTA_ON,                "switching quotas on failed", ""),
    ROW(ERR_QUOTA_OFF,               "switching quotas off failed", ""),
    ROW(ERR_QUOTA_SHELL,             "a quota command could not be run", ""),
    ROW(ERR_ENUM_FAILED,             "an enumeration of users, groups, privileges or shares failed", ""),
    ROW(ERR_BAD_VOLUME_ID,           "a volume identifier could not be parsed or allocated", "check the name"),
    ROW(ERR_BACKUP_DESTINATION,      "setting a local-backup destination failed", ""),
    ROW(ERR_MAKE_PATH,               "making a directory with its parents failed, or a share folder is not empty", ""),
    ROW(ERR_DB_INTERRUPTED,          "a store operation was interrupted", "try again"),
    ROW(ERR_RESERVED_A9,             "reserved", ""),
    ROW(ERR_DB_OPEN,                 "a file is not an account store", ""),
    ROW(ERR_DB_CURSOR,               "reading or walking an account store failed", ""),
    ROW(ERR_DB_STORE,                "storing into an account store failed", "check the free space"),
    ROW(ERR_DB_DELETE,               "deleting from an account store failed", ""),
    ROW(ERR_DB_END,                  "a walk over an account store has ended", ""),
    ROW(ERR_SHARE_FILE_TYPE,         "setting the file type of a share failed", ""),
    ROW(ERR_GROUP_DB_DELETE,         "deleting a group failed", ""),
    ROW(ERR_USER_DB_DELETE,          "deleting a user failed", ""),
    ROW(ERR_LINK_AGGR_OPTION,        "a link-aggregation option does not fit", ""),
    ROW(ERR_LINK_AGGR_TYPE,          "a link-aggregation device has another type", ""),
    ROW(ERR_SIZE_UNKNOWN,            "a tree size or RAID information could not be computed", ""),
    ROW(ERR_TRUNCATED,               "a text did not fit, or a target could not be truncated", ""),
    ROW(ERR_SPACE_CREATE,            "creating a storage space failed", ""),
    ROW(ERR_FS_CHECK,                "a file-system check failed", ""),
    ROW(ERR_XATTR_PATH,              "an extended-attribute path failed", ""),
    ROW(ERR_SERVICE_ACTION,          "a service has no usable way to be switched", ""),
    ROW(ERR_SERVICE_STD_ACTION,      "the script or daemon command of a service failed", "look at the system log"),
    ROW(ERR_SERVICE_REMOVE,          "removing a service failed", ""),
};
// clang-format on

#undef ROW

constexpr bool Ascending()
{
    for (std::size_t i = 1; i < std::size(codes); ++i)
        if (codes[i - 1].code >= codes[i].code)
            return false;
    return true;
}
static_assert(Ascending(), "looked up by halving");

}  // namespace

std::span<const ErrorCode> ErrorCodes()
{
    return codes;
}

const ErrorCode *FindErrorCode(int code)
{
    const auto *found = std::lower_bound(std::begin(codes), std::end(codes), code,
                                         [](const ErrorCode &row, int wanted) { return row.code < wanted; });
    return found != std::end(codes) && found->code == code ? found : nullptr;
}

const ErrorCode *FindErrorCode(const std::string &name)
{
    constexpr std::size_t prefix = 4;  // ERR_
    for (const ErrorCode &row : codes)
        if (::strcasecmp(row.name, name.c_str()) == 0 || ::strcasecmp(row.name + prefix, name.c_str()) == 0)
            return &row;
    return nullptr;
}

std::string ErrorName(int code)
{
    const ErrorCode *row = FindErrorCode(code);
    return row ? row->name : "unnamed";
}

std::string Hexadecimal(int code)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%04X", static_cast<unsigned>(code));
    return text;
}

}  // namespace tavoctl
