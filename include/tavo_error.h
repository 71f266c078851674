/*
 * Error state and error codes.
 *
 * Every function of the library reports failure the same way: it records a code together with the source module and
 * line that found the failure, and returns its failure value (-1, NULL or 0). The whole process shares one record:
 * serialise calls into the library, or accept that another thread's failure overwrites the code before you read it.
 * Success never clears it, so read it only after a failure value.
 */
#ifndef TAVO_ERROR_H
#define TAVO_ERROR_H

#include <stdint.h>

#define TAVO_API __attribute__((visibility("default")))

#ifdef __cplusplus
#define TAVO_BEGIN_DECLS extern "C" {
#define TAVO_END_DECLS   }
#else
#define TAVO_BEGIN_DECLS
#define TAVO_END_DECLS
#endif

TAVO_BEGIN_DECLS

/*
 * The codes: code / 0x100 is the index into rgszErrMsg, the low byte is always 0.
 */
/* clang-format off */
enum {
    ERR_SUCCESS                 = 0x0000,
    ERR_NOT_ENOUGH_MEMORY       = 0x0100,
    ERR_OUT_OF_MEMORY           = 0x0200,
    ERR_ACCESS_DENIED           = 0x0300,
    ERR_LOCK_FAILED             = 0x0400,
    ERR_UNLOCK_FAILED           = 0x0500,
    ERR_PATH_NOT_FOUND          = 0x0600,
    ERR_FILE_NOT_FOUND          = 0x0700,
    ERR_FILE_EXISTS             = 0x0800,
    ERR_OPEN_FAILED             = 0x0900,
    ERR_READ_FAILED             = 0x0A00,
    ERR_WRITE_FAILED            = 0x0B00,
    ERR_CREATE_FAILED           = 0x0C00,
    ERR_BAD_PARAMETERS          = 0x0D00,
    ERR_INVALID_SERVERNAME      = 0x0E00,
    ERR_INVALID_DOMAINNAME      = 0x0F00,
    ERR_INVALID_NETNAME         = 0x1000,
    ERR_SERVER_UNREACHABLE      = 0x1100,
    ERR_INVALID_SHARENAME       = 0x1200,
    ERR_SHARE_EXISTS            = 0x1300,
    ERR_NO_SUCH_SHARE           = 0x1400,
    ERR_TOO_MANY_SHARES         = 0x1500,
    ERR_INVALID_GROUPNAME       = 0x1600,
    ERR_GROUP_EXISTS            = 0x1700,
    ERR_NO_SUCH_GROUP           = 0x1800,
    ERR_TOO_MANY_GROUPS         = 0x1900,
    ERR_INVALID_USERNAME        = 0x1A00,
    ERR_INVALID_PASSWORDNAME    = 0x1B00,
    ERR_USER_EXISTS             = 0x1C00,
    ERR_NO_SUCH_USER            = 0x1D00,
    ERR_WRONG_PASSWORD          = 0x1E00,
    ERR_TOO_MANY_USERS          = 0x1F00,
    ERR_KEY_NOT_FOUND           = 0x2000,
    ERR_KEY_EXISTS              = 0x2100,
    ERR_SECTION_NOT_FOUND       = 0x2200,
    ERR_SECTION_EXISTS          = 0x2300,
    ERR_NOT_ENOUGH_QUOTA        = 0x2400,
    ERR_NOT_ENOUGH_VOLUME_SPACE = 0x2500,
    ERR_SEEK_FAILED             = 0x2600,
    ERR_STAT_FAILED             = 0x2700,
    ERR_RENAME_FAILED           = 0x2800,
    ERR_NOT_ENOUGH_SPACE        = 0x2900,
    ERR_OP_FAILURE              = 0x2A00,
    ERR_DEV_UNCONFIG            = 0x2B00,
    ERR_DEV_UNMOUNTED           = 0x2C00,
    ERR_OP_UNREGISTERED         = 0x2D00,
    ERR_TIMER_EXPIRED           = 0x2E00,
    ERR_READ_GEO                = 0x3000,
    ERR_USAGE                   = 0x3100,
    ERR_UPDATE_OFFSET           = 0x3200,
    ERR_CHECKSUM                = 0x3300,
    ERR_OPEN_RAWDEVICE          = 0x3400,
    ERR_OPEN_OPTFILE            = 0x3500,
    ERR_READ_RAWDEVICE          = 0x3600,
    ERR_WRITE_RAWDEVICE         = 0x3700,
    ERR_BADPATCH                = 0x3800,
    ERR_FORMAT_ERROR            = 0x4000,
    ERR_NO_VOLUME_ID            = 0x6000,
    ERR_NO_DISK_ID              = 0x6100,
    ERR_NOT_ENOUGH_SD           = 0x6200,
    ERR_SD_SIZE_NOT_ALIGN       = 0x6300,
    ERR_DEVICE_BUSY             = 0x6400,
    ERR_INVALID_SD              = 0x6500,
    ERR_FORMAT_FAIL             = 0x6600,
    ERR_CANNOT_REBUILD_DISK     = 0x6700,
    ERR_BROKEN_RAID_CONF        = 0x6800,
    ERR_DISK_TOO_SMALL          = 0x6900,
    ERR_CANNOT_GET_MNTINFO      = 0x6A00,
    ERR_BROKEN_DISK_INFO        = 0x6B00,
    ERR_DISK_IO_FAILED          = 0x6C00,
    ERR_BAD_DISKSECTOR          = 0x6D00,
    ERR_UDPD_INVALID_HANDLE     = 0x7100,
    ERR_UDPD_RUNNING_HANDLE     = 0x7200,
    ERR_UDPD_INVALID_EVENT      = 0x7300,
    ERR_UDPD_INVALID_PARAMETER  = 0x7400,
    ERR_UDPD_EXIT_ABNORMAL      = 0x7500,
    ERR_UDPD_NOT_ENOUGH_SPACE   = 0x7600,
    ERR_UDPD_TIMEOUT            = 0x7700,
    ERR_UDPD_INIT_FAIL          = 0x7800,
    ERR_UDPD_SEND_FAIL          = 0x7900,
    ERR_UDPD_RECV_FAIL          = 0x7A00,
    ERR_UNKNOWN                 = 0x8000,
    ERR_SYS_UNKNOWN             = 0x8100,
    ERR_VOLUME_SIZE_TOO_LARGE   = 0x8200,
    ERR_YP_BIND                 = 0x9000,

    /* The codes that have no text in rgszErrMsg: their slot holds "", or is past the end of the table. */
    ERR_REMOVE_FAILED           = 0x3900, /* removing files or directories failed */
    ERR_MOVE_FAILED             = 0x3A00, /* moving a directory tree failed */
    ERR_COPY_FAILED             = 0x3B00, /* copying files failed */
    ERR_MKDIR_FAILED            = 0x3C00, /* creating a directory or a link failed */
    ERR_AUTOBLOCK_MAP           = 0x3D00, /* mapping the login auto-block database failed */
    ERR_BACKUP_NOT_FOUND        = 0x5000, /* no such backup configuration entry */
    ERR_BACKUP_DELETE           = 0x5400, /* deleting local-backup information failed */
    ERR_APP_BACKUP              = 0x5500, /* an application backup failed */
    ERR_APP_RESTORE             = 0x5600, /* an application restore failed */
    ERR_NO_SERVICE_VOLUME       = 0x8300, /* no volume can be chosen for a service */
    ERR_DB_CLOSE                = 0x8400, /* closing a database, or moving a share, failed */
    ERR_QUOTA_NOT_ENABLED       = 0x9100, /* the volume has no quotas */
    ERR_QUOTA_BAD_ARGUMENT      = 0x9200, /* the kernel refused a quota argument */
    ERR_QUOTA_REMOUNT           = 0x9300, /* remounting a volume with quotas failed */
    ERR_QUOTA_CHECK             = 0x9400, /* building the quota files failed */
    ERR_QUOTA_ON                = 0x9500, /* switching quotas on failed */
    ERR_QUOTA_OFF               = 0x9600, /* switching quotas off failed */
    ERR_QUOTA_SHELL             = 0x9700, /* a quota command could not be run */
    ERR_ENUM_FAILED             = 0x9900, /* an enumeration of users, groups, privileges or shares failed */
    ERR_BAD_VOLUME_ID           = 0x9A00, /* a volume identifier could not be parsed or allocated */
    ERR_BACKUP_DESTINATION      = 0xA000, /* setting a local-backup destination failed */
    ERR_MAKE_PATH               = 0xA100, /* making a directory with its parents failed, or a share folder is not empty */
    ERR_DB_INTERRUPTED          = 0xA700, /* a store operation was interrupted */
    ERR_RESERVED_A9             = 0xA900, /* reserved */
    ERR_DB_OPEN                 = 0xB100, /* a file is not an account store */
    ERR_DB_CURSOR               = 0xB200, /* reading or walking an account store failed */
    ERR_DB_STORE                = 0xB300, /* storing into an account store failed */
    ERR_DB_DELETE               = 0xB400, /* deleting from an account store failed */
    ERR_DB_END                  = 0xB500, /* a walk over an account store has ended */
    ERR_SHARE_FILE_TYPE         = 0xB600, /* setting the file type of a share failed */
    ERR_GROUP_DB_DELETE         = 0xB700, /* deleting a group failed */
    ERR_USER_DB_DELETE          = 0xB800, /* deleting a user failed */
    ERR_LINK_AGGR_OPTION        = 0xBB00, /* a link-aggregation option does not fit */
    ERR_LINK_AGGR_TYPE          = 0xBC00, /* a link-aggregation device has another type */
    ERR_SIZE_UNKNOWN            = 0xBE00, /* a tree size or RAID information could not be computed */
    ERR_TRUNCATED               = 0xBF00, /* the text did not fit, or a target could not be truncated */
    ERR_SPACE_CREATE            = 0xC000, /* creating a storage space failed */
    ERR_FS_CHECK                = 0xC200, /* a file-system check failed */
    ERR_XATTR_PATH              = 0xC300, /* an extended-attribute path failed */
    ERR_SERVICE_ACTION          = 0xD300, /* a service has no usable way to be switched */
    ERR_SERVICE_STD_ACTION      = 0xD400, /* the script or daemon command of a service failed */
    ERR_SERVICE_REMOVE          = 0xD500 /* removing a service failed */
};
/* clang-format on */

/* The code of the last failure; 0 (ERR_SUCCESS) when nothing has failed yet. */
extern TAVO_API int32_t tavoerrno;

/* The names of the codes 0x0000 to 0x9000, by code / 0x100. A slot without a name points to "", never to NULL. */
extern TAVO_API const char *const rgszErrMsg[145];

/* The number of entries of rgszErrMsg: 145. */
extern TAVO_API const int32_t errNum;

/* Always 96; nothing in the library reads it. */
extern TAVO_API const int32_t codeNum;

/* A second error code, for the volume module only; independent of tavoerrno. */
extern TAVO_API int32_t volerr;

/* Returns tavoerrno. */
TAVO_API int TLIBErrGet(void);

/* Sets tavoerrno to code and clears the source: the module becomes NULL and the line 0. Meant for programs; the library
 * itself always records a source. */
TAVO_API void TLIBErrSet(int code);

/* Records code with the module and line that found it. The module's text is not copied: the pointer must stay valid
 * for the life of the process, so pass a literal. */
TAVO_API void TLIBErrSetEx(int code, const char *szModule, int line);

/* The module recorded by the last TLIBErrSetEx; NULL before the first one and after TLIBErrSet. Not to be freed. */
TAVO_API const char *TAVOErrorGetFile(void);

/* The line recorded by the last TLIBErrSetEx; 0 before the first one and after TLIBErrSet. */
TAVO_API int TAVOErrorGetLine(void);

/* Prints the name of the code in the calling thread's errno (not tavoerrno), and a newline, to standard output. A code
 * without a name prints an empty line; a value that is not a code (low byte not 0, or outside the table) prints
 * nothing. */
TAVO_API void TLIBErrPrint(void);

/* Empties the log file szPath, creating it (mode 0644) when it is missing, and syncs it to disk. A NULL path, or a file
 * that cannot be opened, is silently left alone. In a directory that everybody may write to, only a regular file that
 * belongs to root or to the caller and has no second name is emptied. Sets no code. */
TAVO_API void TLIBErrLogInitial(const char *szPath);

/* Appends szMessage and a newline to the log file szPath (created with mode 0644 when missing) and syncs it to disk.
 * "%%" in the message is written as one "%"; every other "%" is written as it is.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  szPath or szMessage is NULL
 *   ERR_OPEN_FAILED     the file cannot be opened, or TLIBErrLogInitial would leave it alone
 *   ERR_WRITE_FAILED    the text could not be written and synced; the file may hold a part of it */
TAVO_API int TLIBErrLogSet(const char *szPath, const char *szMessage);

/* Reserved entry points; they do nothing. */
TAVO_API void TAVOErrorBackTracePrint(void);
TAVO_API void TAVOErrorBackTraceLog(void);
TAVO_API void TAVOErrorBackTracePanic(void);

/* Returns volerr. */
TAVO_API int TAVOVolGetErr(void);

/* Sets volerr. */
TAVO_API void TAVOVolISetErr(int code);

TAVO_END_DECLS

#endif
