/*
 * Disks: listing them, their places, their properties and their power state.
 *
 * A disk is "/dev/sd" and one letter (an internal bay or an external port) or two (the unit letter and the disk letter
 * of an expansion unit); a partition appends its decimal number. Functions that take a path accept exactly these names,
 * with "/dev/" or, where stated, without; "a" is bay 1. A device number is major * 256 + minor.
 *
 * Nothing is locked and nothing is cached. Power functions handle one disk after another: serialise them. Reading SMART
 * data (temperatures too) wakes a disk that sleeps.
 *
 * "Logged" failures leave a line in the system log; a code is recorded only where one is named.
 */
#ifndef TAVO_DISK_H
#define TAVO_DISK_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* How a disk is named (the field nNameKind). */
enum {
    DISK_NAME_PORT = 1, /* one letter: an internal bay or an external port */
    DISK_NAME_UNIT = 2  /* two letters: a disk of an expansion unit */
};

/* Where a disk sits (DiskContainerGet, and the mask of PartitionPathEnum). */
enum {
    DISK_CONTAINER_INTERNAL = 1, /* one letter, a to j */
    DISK_CONTAINER_UNIT = 2,     /* two letters */
    DISK_CONTAINER_EXTERNAL = 4, /* USB: one letter after j */
    DISK_CONTAINER_ESATA = 8     /* the name that "esatadiskname" of /etc.defaults/tavoinfo.conf gives */
};

/* Which disks DiskInfoEnum looks for; 0 means all. */
enum { DISK_ENUM_INTERNAL = 1, DISK_ENUM_UNITS = 2 };

/* The code of TAVOIDiskRawOpen for a device that is not a disk. It has no text. */
enum { ERR_NOT_A_DISK = 22 };

/* Commands of the two command interfaces. */
enum {
    DISK_COMMAND_SMART_ENABLE = 0,
    DISK_COMMAND_SMART_DATA = 1,       /* 512 bytes */
    DISK_COMMAND_SMART_THRESHOLDS = 2, /* 512 bytes */
    DISK_COMMAND_SMART_SELFTEST = 3,   /* 512 bytes: the self-test log */
    DISK_COMMAND_CHECK_POWER = 4,      /* 1 byte: 0 is standby */
    DISK_COMMAND_SET_TIMER = 5,        /* takes 1 byte: the spin-down timer; marvell_command_interface only */
    DISK_COMMAND_STANDBY = 6,
    DISK_COMMAND_IDENTIFY = 7,        /* 512 bytes, as the drive sends them: little-endian words */
    DISK_COMMAND_IDENTIFY_PACKET = 8, /* 512 bytes */
    DISK_COMMAND_FLUSH = 9
};

/* A parsed path. */
typedef struct DISKPATH {
    int32_t iDisk;      /* the last or only letter: a is 1 */
    int32_t nNameKind;  /* DISK_NAME_ */
    int32_t iUnit;      /* the first of two letters: a is 1; 0 for one letter */
    int32_t nPartition; /* the number after the letters; 0 without one */
} DISKPATH;

/* The description of a disk. */
typedef struct DISKINFO {
    int32_t iDisk;
    int32_t nNameKind;
    int32_t iUnit;
    int32_t nPartition;                          /* as in the path that was asked for */
    char szPath[128];                            /* the whole disk: /dev/sda */
    char szModel[128];                           /* as the drive reports it, blanks at its end included */
    uint64_t cbDisk __attribute__((aligned(8))); /* bytes, whole sectors of 512 */
    int32_t nTemperature;                        /* degrees Celsius; -1 when not known */
} DISKINFO;

/* A node of the list of DiskInfoEnum. */
typedef struct DISKLIST {
    DISKINFO *pInfo;
    struct DISKLIST *pNext;
} DISKLIST;

/* The summary of TAVODiskGetInfo. */
typedef struct TAVODISKINFO {
    int32_t nDevice;                               /* major * 256 + minor */
    char szName[64];                               /* as in /proc/partitions: sda */
    int32_t nKind;                                 /* 7 */
    uint64_t cMibDisk __attribute__((aligned(8))); /* MiB */
    int32_t nStatus;                               /* 0 */
} TAVODISKINFO;

/* Values of TavoPartitionLayout.nKind and TavoPartitionEntry.nKind. */
enum {
    DISK_LAYOUT_UNSET = 0,
    DISK_LAYOUT_PLAIN = 1,  /* partitions that match no layout of the system */
    DISK_LAYOUT_SYSTEM = 2, /* see tavo_partition.h */
    DISK_LAYOUT_SPECIAL = 3 /* a device whose data is in a fixed partition */
};
enum {
    DISK_ENTRY_UNUSED = 0,
    DISK_ENTRY_DISK = 1,
    DISK_ENTRY_PARTITION = 2,
    DISK_ENTRY_DATA = 3, /* partition 3 of a system layout */
    DISK_ENTRY_SPECIAL = 4
};

enum { DISK_LAYOUT_ENTRIES = 513 };

typedef struct TavoPartitionEntry {
    int32_t nMajor;
    int32_t nMinor;
    int32_t iEntry;
    int32_t nKind; /* DISK_ENTRY_ */
    int32_t nReserved;
    int64_t cBlock __attribute__((aligned(8))); /* KiB */
    char szDisk[128];                           /* sda */
    char szName[128];                           /* sda or sda3 */
    char szPath[128];                           /* /dev/sda or /dev/sda3 */
} TavoPartitionEntry;

/* The partitions of one disk: entry 0 is the whole disk, entry i partition i. About 210 KiB. */
typedef struct TavoPartitionLayout {
    int32_t nKind;    /* DISK_LAYOUT_ */
    int32_t nEntry;   /* lines of /proc/partitions that matched */
    char szDisk[128]; /* sda */
    TavoPartitionEntry rgEntry[DISK_LAYOUT_ENTRIES];
} TavoPartitionLayout;

/* --- which disks there are --- */

/* Parses a path ("/dev/sda3" or "sda3"; a newline may follow). Returns 0; -1, logged, with *pParsed untouched, when the
 * path does not name a disk; -1 with ERR_BAD_PARAMETERS when an argument is NULL. Text after the first digit is not
 * checked. */
TAVO_API int DiskPathParse(const char *szPath, DISKPATH *pParsed);

/* Reads path, model, size and temperature of a disk; szPath names the disk or a partition of it. *ppInfo becomes a new
 * record that the caller releases with DiskInfoFree. The sources are the device, /sys/block/NAME/device/model and SMART
 * attribute 194.
 * Returns 1; 0 when the bay is empty (opening the device fails with ENXIO), silently; -1, logged, with
 *   ERR_BAD_PARAMETERS   an argument is NULL
 *   ERR_OUT_OF_MEMORY
 * or without a code of its own when szPath is not a disk, or the disk cannot be opened or its size read. *ppInfo is
 * written only when 1 is returned. A model that cannot be read is empty.
 * Files: /sys/block */
TAVO_API int DiskInfoGet(const char *szPath, DISKINFO **ppInfo);
TAVO_API void DiskInfoFree(DISKINFO *pInfo);

/* Reads the disks of all internal bays (TAVOMaxDiskGet; not the ports that lead to an expansion unit) and of all
 * expansion units that have power, in this order. pFilter points to DISK_ENUM_ flags; NULL or 0 for all. Empty bays are
 * skipped; disks that cannot be read are skipped and logged.
 * Returns the number of disks and stores the list (NULL for none) in *ppList; the caller releases it with
 * DiskInfoEnumFree. Returns -1 with *ppList NULL and ERR_BAD_PARAMETERS (ppList is NULL), ERR_OUT_OF_MEMORY, or a code
 * of TAVOEBoxInfoEnum.
 * Files: /etc.defaults/tavoinfo.conf, /sys/block */
TAVO_API int DiskInfoEnum(const int *pFilter, DISKLIST **ppList);
TAVO_API void DiskInfoEnumFree(DISKLIST *pList);

/* Appends a node with pInfo, which then belongs to the list. Returns 0, or -1 with ERR_BAD_PARAMETERS or
 * ERR_OUT_OF_MEMORY, and then the caller keeps pInfo. */
TAVO_API int DiskListPush(DISKLIST **ppList, DISKINFO *pInfo);

/* Lists the device numbers of all whole disks of /proc/partitions, IDE disks first. *ppNumber becomes a heap array that
 * the caller releases with free. nKind must be 1. Returns the count; 0 with *ppNumber NULL when there is none; -1 with
 *   ERR_BAD_PARAMETERS   nKind is not 1 or ppNumber is NULL
 *   ERR_OUT_OF_MEMORY
 *   ERR_OPEN_FAILED, ERR_READ_FAILED   /proc/partitions
 * Files: /proc/partitions */
TAVO_API int TAVODiskEnum(int nKind, int32_t **ppNumber);

/* Reads the summary of the disk with that device number. *ppInfo becomes a heap block that the caller releases with
 * free. nKind must be 1. Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS      nKind is not 1 or ppInfo is NULL
 *   ERR_NO_DISK_ID          /proc/partitions has no whole disk of this number
 *   ERR_DISK_IO_FAILED      the disk cannot be opened or its size read
 *   ERR_NOT_ENOUGH_MEMORY   no memory for the record
 *   ERR_OUT_OF_MEMORY, ERR_OPEN_FAILED, ERR_READ_FAILED   /proc/partitions
 * Files: /proc/partitions */
TAVO_API int TAVODiskGetInfo(int nKind, int nDevice, TAVODISKINFO **ppInfo);

/* Finds where a disk sits and stores the DISK_CONTAINER_ value in *pKind. The path may lack its "/dev/". Returns 0, or
 * -1, logged. Sets no code. */
TAVO_API int DiskContainerGet(const char *szPath, int *pKind);

/* Returns 1 when the disk can be opened, 0 when not, -1 with ERR_BAD_PARAMETERS for NULL. */
TAVO_API int DiskIsExist(const char *szPath);

/* Reads the size of a disk in sectors of 512 bytes. Returns 1; 0 when the disk is absent (ENXIO), silently; -1, logged,
 * on failure; -1 with ERR_BAD_PARAMETERS for a NULL argument. */
TAVO_API int DiskSizeGet(const char *szPath, uint64_t *pcSector);

/* Reads the size in MiB of the device with the kernel name szName ("sdq1"). Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS   an argument is NULL, or szName is empty, begins with a dot or holds a "/"
 *   ERR_DISK_IO_FAILED   the device cannot be opened or its size read */
TAVO_API int TAVODiskUSBGetInfo(const char *szName, uint64_t *pcMib);

/* Splits a name at its trailing number: "sda3" into "sda" and 3. The number begins at a digit from 1 to 9, so "sda10"
 * becomes "sda" and 10, and "sda03" becomes "sda0" and 3. The name must fit in cbBase bytes with its NUL.
 * Returns the number; 0 without one, when the name is the whole path; -1, with szBase unchanged, when the path begins
 * with a digit from 1 to 9, is empty, or its name or number is too long; -1 with ERR_BAD_PARAMETERS when an argument is
 * NULL or cbBase is below 2. */
TAVO_API int TAVODiskPartitionNumGet(const char *szPath, char *szBase, int cbBase);

/* Returns the path of the disk or partition that an open descriptor belongs to, as a heap string that the caller
 * releases with free. The source is /sys/dev/block. NULL with
 *   ERR_STAT_FAILED     fd is not an open descriptor
 *   ERR_NOT_A_DISK      it is not a block device
 *   ERR_NO_DISK_ID      the kernel has no such device (any more)
 *   ERR_OUT_OF_MEMORY
 * Files: /sys/dev/block */
TAVO_API char *TAVODiskGetDevnameFromFd(int fd);

/* Copies the drive model of the whole disk szPath from /sys/block/NAME/device/model; text that does not fit is cut.
 * Returns 0; -1, logged, when the disk cannot be opened or has no model; -1 with ERR_BAD_PARAMETERS for a NULL
 * argument, a size below 1 or a path that is not "/dev/" and a plain name.
 * Files: /sys/block */
TAVO_API int TAVOLnxDiskGetModel(const char *szPath, char *szModel, int cbModel);

/* Returns 1 when the disk's controller takes raw commands through marvell_command_interface, else 0; -1, logged, when
 * the disk's link in /sys/block or the controller's id cannot be read.
 * Files: /sys/block */
TAVO_API int TAVODiskIsMvSocDriver(const char *szPath);

/* Returns 1 when the drive's identification says that it has no rotating medium, else 0; -1, logged, when the
 * identification cannot be read. An old drive without SMART counts as one without a rotating medium. */
TAVO_API int TAVODiskIsSSD(const char *szPath);

/* Returns 1 when a USB disk carries a FAT or NTFS file system without a partition table, else 0; 0 also when its first
 * sector cannot be read. Sets no code. */
TAVO_API int TAVOIsUSBDiskFATNoPartition(const char *szPath);

/* Reads the progress of a disk's wiping job, in MiB, from /tmp/tavodd.NAME, which the job writes. Returns 0 when both
 * numbers were read; 0 with both outputs unchanged when the file does not exist because no job runs; -1 when the line is
 * malformed, an argument is NULL, or the path does not end in a plain name.
 * Files: /tmp/tavodd.* */
TAVO_API int DiskDDStatusGet(const char *szPath, uint64_t *pcMibDone, uint64_t *pcMibTotal);

/* Clears a layout and numbers the entries 0 to 511. NULL is ignored. */
TAVO_API void DiskPartitionsLayoutInit(TavoPartitionLayout *pLayout);

/* Fills the caller's block with the partitions of the disk of kernel name szName ("sda") from /proc/partitions, and
 * sets the kind of their layout. Returns 0, also when the disk does not exist (nEntry is then 0); -1, logged, when the
 * file cannot be read; -1 with ERR_BAD_PARAMETERS when an argument is NULL or the name shorter than 2 characters.
 * Files: /proc/partitions */
TAVO_API int DiskPartitionsLayoutGet(const char *szName, TavoPartitionLayout *pLayout);

/* --- raw commands --- */

/* Opens a disk for raw commands: read-only, non-blocking, close-on-exec. Returns the descriptor, the caller's to close,
 * or -1 with
 *   ERR_BAD_PARAMETERS    szPath is NULL
 *   ERR_OPEN_RAWDEVICE    it cannot be opened
 *   ERR_STAT_FAILED       its state cannot be read
 *   ERR_NOT_A_DISK        it is not a block device with the major number of a disk */
TAVO_API int TAVOIDiskRawOpen(const char *szPath);

/* Sends one DISK_COMMAND_ to an open disk. pData receives (or holds) the command's data; it may be NULL for a command
 * without data. Returns 0, or -1, logged. Sets no code. ata_command_interface uses the HDIO_DRIVE_CMD request,
 * marvell_command_interface SCSI pass-through (SG_IO), for controllers without that request. */
TAVO_API int ata_command_interface(int fd, int nCommand, unsigned char *pData);
TAVO_API int marvell_command_interface(int fd, int nCommand, unsigned char *pData);

/* Reads the 512 bytes of SMART data into pBuffer, enabling SMART first when it is off. With fCheck the thresholds must
 * also be readable, and the bytes of the data page must sum to 0 modulo 256. Returns 0, or -1 (a wrong sum is logged).
 * */
TAVO_API int SmartDataRead(const char *szPath, unsigned char *pBuffer, int fCheck);

/* Returns SMART attribute 194 in degrees Celsius; -1 when the disk has no such attribute, or, logged, cannot be read.
 * */
TAVO_API int TAVODiskTemperatureGet(const char *szPath);
TAVO_API int TAVODiskTemperatureC(const char *szPath);

/* --- power and cache. All return -1 when the disk cannot be opened (the codes of TAVOIDiskRawOpen) or refuses --- */

/* Reads the power state into *pState: 0 is standby, other values mean spinning. Returns 0 or -1. */
TAVO_API int TAVOIDiskCheckPower(const char *szPath, unsigned char *pState);

/* Spins a disk down, unless it is in standby already. Returns 0 or -1. A NULL path is logged. */
TAVO_API int TAVOIDiskSetDiskStandby(const char *szPath);

/* Writes the kernel's buffers to the disk and flushes the drive's cache. Returns 0 or -1. */
TAVO_API int TAVOIDiskFlushBuffer(const char *szPath);

/* Puts the drive to sleep; only a reset wakes it. Returns 0 or -1. */
TAVO_API int TAVOIDiskEnterSleep(const char *szPath);

/* Resets the drive, waits 10 seconds and switches DMA on. Returns 0, or non-zero. */
TAVO_API int TAVOIDiskReset(const char *szPath);

/* Sets the drive's spin-down timer: nValue 0 to 255 as ATA encodes it (0: never). Returns 0 or -1; ERR_BAD_PARAMETERS
 * for another value or a NULL path. */
TAVO_API int TAVOIDiskSetDiskStandbyTimer(const char *szPath, int nValue);

/* Flushes /dev/sda to /dev/sdj, waits 10 seconds and spins each down. Returns 0 when every present disk did. */
TAVO_API int TAVODiskSetStandby(void);

/* Sets the spin-down timer of /dev/sda to /dev/sdj. nMinute is 0 (never), 1 to 21, a multiple of 30 up to 330, or 480.
 * Every choice but 0 programs the same fixed value, 0xFB: the drives' own timer only backs up the system's. The minutes
 * are saved when all drives accepted it. Returns 0, or -1 with nothing saved: ERR_BAD_PARAMETERS for other minutes,
 * otherwise when a drive refused or saving failed. */
TAVO_API int TAVODiskSetStandbyTimer(int nMinute);

/* As TAVODiskSetStandbyTimer with 1 to 1200 seconds, rounded up to a multiple of 5; nothing is saved. Returns -1 with
 * ERR_BAD_PARAMETERS for other values. */
TAVO_API int TAVODiskSetStandbySeconds(int nSecond);

/* Reads the saved minutes. Returns 0; -1 with ERR_BAD_PARAMETERS for NULL, or when nothing is saved. */
TAVO_API int TAVODiskGetStandbyTimer(int *pnMinute);

/* The saved minutes, the key "standbytimer" of /etc/tavoinfo.conf. Get returns them, or -1 when the key is not a
 * number. Set returns 0, or -1 with the code of TAVOINFOSetKeyValue; it takes the lock of the settings file.
 * Files: /etc/tavoinfo.conf */
TAVO_API int TAVODiskGetFileSBTimerSetting(void);
TAVO_API int TAVODiskSetFileSBTimerSetting(int nMinute);

/* The drive's write cache. Get returns 1 when it is enabled, 0 when it is disabled or unknown. Set returns 0 or -1. */
TAVO_API int TAVODiskWriteCacheGet(const char *szPath);
TAVO_API int TAVODiskWriteCacheSet(const char *szPath, int fEnable);

TAVO_END_DECLS

#endif
