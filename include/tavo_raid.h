/*
 * RAID: the md arrays that the appliance's disks are joined into.
 *
 * An array is "/dev/md" and its number. /dev/md0 is the system array over partition 1 of every disk, /dev/md1 the swap
 * array over partition 2; the others hold data. A member is "/dev/" and the kernel name of a partition or disk. Other
 * text is refused before any program runs.
 *
 * Arrays are read through the md driver's requests, /sys/block/mdN and "mdadm -E", and changed by /sbin/mdadm. Nothing
 * is locked: serialise changes of an array. "Logged" failures leave a line in the system log; a code is recorded only
 * where one is named.
 */
#ifndef TAVO_RAID_H
#define TAVO_RAID_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

struct mdu_array_info_s; /* mdu_array_info_t of <linux/raid/md_u.h> */

/* RAID levels, one bit each. */
enum {
    RAID_LEVEL_0 = 1,
    RAID_LEVEL_1 = 2,
    RAID_LEVEL_5 = 4,
    RAID_LEVEL_6 = 8,
    RAID_LEVEL_10 = 16,
    RAID_LEVEL_LINEAR = 32
};

/* The health of an array. */
enum { RAID_STATUS_NORMAL = 1, RAID_STATUS_DEGRADED = 2, RAID_STATUS_CRASHED = 3 };

/* The state of a member; bits, for the mask of RAIDDiskCount. */
enum {
    RAID_MEMBER_ACTIVE = 1, /* in sync */
    RAID_MEMBER_SPARE = 2,  /* a spare, or still being rebuilt */
    RAID_MEMBER_FATAL = 4,  /* failed, and the array with it */
    RAID_MEMBER_FAILED = 8  /* failed; the level tolerates it */
};

typedef struct RAIDMEMBER {
    char szPath[128]; /* "/dev/sda3" */
    int32_t nState;   /* RAID_MEMBER_ */
    struct RAIDMEMBER *pNext;
} RAIDMEMBER;

/* The description of an array. */
typedef struct RAIDINFO {
    int32_t nArray;
    char szPath[128];                             /* "/dev/md2" */
    int32_t fLevel;                               /* RAID_LEVEL_ */
    int32_t nStatus;                              /* RAID_STATUS_ */
    int32_t fRebuilding;                          /* 1 while members are being rebuilt or reshaped */
    uint64_t cbArray __attribute__((aligned(8))); /* bytes */
    uint64_t cbMember;                            /* bytes used on each member; 0 for RAID 0 and linear */
    int32_t nSlot;                                /* members that the array is made for, without spares */
    int32_t nWorking;                             /* members that have not failed, with spares */
    int32_t nFailed;
    RAIDMEMBER *pMembers; /* in the order of the kernel's numbers; belongs to the record */
} RAIDINFO;

typedef struct RAIDLIST {
    RAIDINFO *pInfo;
    struct RAIDLIST *pNext;
} RAIDLIST;

/* A member's superblock. */
typedef struct RAIDSUPERBLOCK {
    int32_t nMajor; /* version: 0.90, 1.2 */
    int32_t nMinor;
    char szUuid[64];  /* of the array: "495e879a:4e806313:a484c744:9c844bd2"; empty without a superblock */
    char szArray[64]; /* "/dev/md2"; empty when the array's name holds no number */
    int32_t fLevel;   /* RAID_LEVEL_ */
    int32_t nMember;  /* slots of the array */
    int32_t iRole;    /* slot of this member; -1 for a spare */
    int32_t nEvent;
} RAIDSUPERBLOCK;

typedef struct RAIDSBENTRY {
    char szMember[128];
    RAIDSUPERBLOCK superblock;
} RAIDSBENTRY;

/* The progress of a rebuild. 20 bytes without padding: copy the 64-bit fields out, take no pointer to them. */
typedef struct __attribute__((packed)) RAIDPROGRESS {
    int32_t nState;  /* 0: no rebuild runs; 1: one runs; 2: one runs and has not finished any sector yet */
    int64_t cDone;   /* sectors */
    int64_t cSector; /* total sectors */
} RAIDPROGRESS;

typedef struct RAIDVERSION {
    int32_t nMajor;
    int32_t nMinor;
} RAIDVERSION;

/* The array that RAIDCreate makes. */
typedef struct RAIDREQUEST {
    const char *szPath;
    const RAIDVERSION *pVersion; /* of the superblock; NULL for 1.1 */
    int32_t fLevel;              /* RAID_LEVEL_ */
    int32_t nSpare;
    int32_t nSlot;                                /* at least 1; slots without a member are left missing */
    uint64_t cbArray __attribute__((aligned(8))); /* bytes to use on each member; 0: all, or the model's limit */
    const TLIBSZLIST *pslMembers;                 /* the spares are the last ones */
    int32_t fSync;                                /* 0: assume that the members are in sync */
} RAIDREQUEST;

/* --- reading arrays --- */

/* Reads an array. *ppInfo becomes a new record that the caller releases with RAIDInfoFree. Returns 1; 0, silently, when
 * there is no such array or it does not run; -1, logged, with *ppInfo untouched and
 *   ERR_BAD_PARAMETERS   an argument is NULL or szPath is not an array (not logged)
 *   ERR_OPEN_FAILED      the device cannot be opened
 *   ERR_SIZE_UNKNOWN     the driver does not describe the array
 *   ERR_UNKNOWN          its level is not one of RAID_LEVEL_
 *   ERR_OUT_OF_MEMORY
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDInfoGet(const char *szPath, RAIDINFO **ppInfo);

/* Returns a copy of the record with its members, which the caller releases with RAIDInfoFree. NULL with
 * ERR_BAD_PARAMETERS or ERR_OUT_OF_MEMORY. */
TAVO_API RAIDINFO *RAIDInfoDup(const RAIDINFO *pInfo);
TAVO_API void RAIDInfoFree(RAIDINFO *pInfo);

/* Reads all arrays. Returns the number of records and stores the list (NULL for none) in *ppList; the caller releases
 * it with RAIDListFree. Returns -1 with *ppList NULL and ERR_BAD_PARAMETERS, or, logged, a code of RAIDPathEnum or
 * RAIDInfoGet. An array that disappears while it is read is skipped.
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDInfoEnum(RAIDLIST **ppList);

/* Appends the paths of all arrays in /sys/block, by number, to the caller's list, which may move. Returns their
 * number; -1 with ERR_BAD_PARAMETERS, ERR_OPEN_FAILED or ERR_OUT_OF_MEMORY.
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDPathEnum(TLIBSZLIST **ppList);

/* Appends a node with pInfo, which then belongs to the list. Returns 0, or -1 with ERR_BAD_PARAMETERS or
 * ERR_OUT_OF_MEMORY, and then the caller keeps pInfo. */
TAVO_API int RAIDListPush(RAIDLIST **ppList, RAIDINFO *pInfo);
TAVO_API int RAIDListCount(const RAIDLIST *pList);

/* Finds the array with that path. Returns 1 and the record, which the list still owns, in *ppInfo; 0 without one; -1
 * with
 * ERR_BAD_PARAMETERS. */
TAVO_API int RAIDListSearch(const RAIDLIST *pList, const char *szPath, RAIDINFO **ppInfo);
TAVO_API void RAIDListFree(RAIDLIST *pList); /* with the records */

/* Derives the health of an array from the kernel's description (its level and number of slots) and its members. Returns
 * 0; -1, logged, for a level that is not one of RAID_LEVEL_; -1 with ERR_BAD_PARAMETERS for a NULL argument (pMembers
 * may be NULL: no members). */
TAVO_API int RAIDStatusDecide(const struct mdu_array_info_s *pArray, const RAIDMEMBER *pMembers, int *pStatus);

/* Returns the largest number of disks, of nDisk, whose loss the level can survive; -1 for an unknown level. */
TAVO_API int RAIDParityDiskCount(int fLevel, int nDisk);

/* Returns the number of members whose state is among the RAID_MEMBER_ bits of fState. */
TAVO_API int RAIDDiskCount(const RAIDMEMBER *pMembers, int fState);

/* Asks the appliance's driver for an open array's health. Returns 0, or -1 with ERR_PATH_NOT_FOUND (the array does not
 * run), ERR_UNKNOWN (logged: another answer, or a driver without this request) or ERR_BAD_PARAMETERS. */
TAVO_API int RAIDIoctlStatus(int fd, int *pStatus);

/* Asks the appliance's driver for the progress of an open array's rebuild. Returns 0, or -1 as RAIDIoctlStatus. */
TAVO_API int RAIDRebuildStatusGet(int fd, RAIDPROGRESS *pProgress);

/* Waits until the rebuild of an array has ended, which can take hours; it checks every 30 seconds. Returns 0 when the
 * array's status is then normal; -1, logged, when it is not, or when reading the array failed five times in a row. */
TAVO_API int RAIDRebuildingWait(const char *szPath);

/* The same for each path in turn; stops at the first failure, logged. */
TAVO_API int RAIDRebuildingMultiWait(const TLIBSZLIST *pslPaths);

/* Returns the stripe size in KiB: chunk size times data members; 0 for RAID 1 and linear. -1 with ERR_OPEN_FAILED (the
 * chunk size cannot be read, or there is no such array) or a code of RAIDInfoGet; -1, logged, for any other level. */
TAVO_API int RAIDMdStripeSizeGet(const char *szPath);

/* --- superblocks --- */

/* Reads the superblock of a member with "mdadm -E" into the caller's record. Returns 1 when mdadm printed anything; it
 * also does so for a partition table, so check szUuid. Returns 0, with the record cleared, when it printed nothing; -1,
 * logged, when it could not be run; -1 with ERR_BAD_PARAMETERS for a NULL argument or text that is not a device. A line
 * that cannot be parsed is logged and ends the reading.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBGet(const char *szMember, RAIDSUPERBLOCK *pSuperblock);

/* Reads the superblocks of several members; those without one are left out. *ppEntry becomes a heap array that the
 * caller releases with free. Returns their number; 0 with *ppEntry NULL; -1 with ERR_BAD_PARAMETERS, ERR_OUT_OF_MEMORY,
 * or as RAIDSBGet.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBEnum(const TLIBSZLIST *pslMembers, RAIDSBENTRY **ppEntry);

/* Erases the superblock of a member. Returns 0 or -1, logged.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBClean(const char *szMember);

/* Erases the superblocks of all disks and partitions that belong to the array with that complete UUID. Stop the array
 * first. pInfo is ignored and may be NULL. Returns 0; -1, logged, at the first failure; -1 with ERR_BAD_PARAMETERS,
 * before any disk is touched, for text that is not a UUID.
 * Files: /proc/partitions
 * Runs: /bin/grep, /sbin/mdadm */
TAVO_API int RAIDSBCleanByUUID(const RAIDINFO *pInfo, const char *szUuid);

/* Reads the UUID of a running array from a member's superblock. Returns 1; 0 when no member has one; -1 with
 * ERR_BAD_PARAMETERS, ERR_NOT_ENOUGH_MEMORY (cbUuid is too small), or a code of RAIDInfoGet.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDUUIDGet(const char *szPath, char *szUuid, int cbUuid);

/* Checks whether the disk szDisk ("/dev/sda") is a member of an array: by its partition 3 or 5, or as a whole, which
 * counts only for arrays above 100. Returns 1 and the array's number in *pnArray, which may be NULL; 0 when it is not a
 * member; -1 when a superblock cannot be read, or with ERR_BAD_PARAMETERS.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDDiskIsUsedByRAID(const char *szDisk, int *pnArray);

/* --- changing arrays. All return 0, or -1, logged; ERR_BAD_PARAMETERS for an argument that is not an array or device.
 * A member or an array that is larger than the kernel can reach (16 TiB with a 32-bit one) is refused before anything is
 * written: -1 without a code --- */

/* Creates an array and tunes it. The data on the members is lost.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDCreate(const RAIDREQUEST *pRequest);

/* Starts an array from the members that carry its UUID, or from the members of a record. When members
 * of the record are missing, but enough are present for a degraded array, it is started by their UUID. A reshape, rebuild
 * or resync that was interrupted goes on.
 * Files: /sys/block/mdN/md
 * Runs: /bin/echo, /sbin/mdadm */
TAVO_API int RAIDAssemble(const char *szPath, const char *szUuid);
TAVO_API int RAIDAssembleByInfo(const RAIDINFO *pInfo);

/* Stops an array; its members keep their superblocks.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDStop(const char *szPath);

/* Stops an array and erases the superblocks of its members. RAIDRemoveMultiple does so for a list: arrays that do
 * not exist are skipped, and a failure does not stop it.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDRemove(const RAIDINFO *pInfo);
TAVO_API int RAIDRemoveMultiple(const TLIBSZLIST *pslPaths);

/* Adds a member: as a spare, onto which the array is rebuilt when a member is missing; to a linear array at its end.
 * Impossible for RAID 0. Only the path and level of the record are used.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDAdd(const RAIDINFO *pInfo, const char *szMember);

/* As RAIDAdd, after checking that the member is large enough:
 *   ERR_NOT_ENOUGH_SPACE   the member is too small
 *   ERR_PATH_NOT_FOUND     the member is absent
 *   ERR_SYS_UNKNOWN        its size cannot be read, or adding failed */
TAVO_API int RAIDAddRobustCheck(const RAIDINFO *pInfo, const char *szMember);

/* Removes a failed or spare member and checks that it is gone. A member whose disk was pulled has no device node any
 * more; its path is "/dev/" and the name that the kernel keeps for it, and it is removed in any state.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDRemoveDisk(const RAIDINFO *pInfo, const char *szMember);

/* Replaces a member of a RAID 1, 5, 6 or 10 by a new disk and starts the rebuild; RAIDRebuildingWait waits for it.
 * szOld is the path of the replaced member: a failed one, a spare, or one whose disk was pulled. NULL means the only
 * failed or pulled member, or, without one, a free slot. szNew is the whole disk ("/dev/sdd"). Unless it has them
 * already, it gets the system's partitions like the disk of another member, and the partition with the same number
 * joins the array; in an array of whole disks the disk joins. All data on them is lost, superblocks included. Each step
 * is logged.
 *   ERR_BAD_PARAMETERS     the array, level or path is not valid
 *   ERR_NOT_ENOUGH_SPACE   the new disk is too small; nothing has changed
 *   ERR_SYS_UNKNOWN        mdadm refused the new member; the old one is removed and the disk partitioned
 * -1 without a code, logged, with nothing changed: the old member is ambiguous or healthy, the new disk is in use, or
 * no other member's disk shows how to partition it.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDReplaceDisk(const RAIDINFO *pInfo, const char *szOld, const char *szNew);

/* Changes the number of slots.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDDevCountChange(const RAIDINFO *pInfo, int nSlot);

/* Turns a RAID 5 into a RAID 6 with new members. With more than one it waits until the first is rebuilt, adds the
 * others and sets the number of slots to the number of new members minus 1; mdadm refuses fewer slots than before.
 * -1 with nothing changed when a new member is in use or too small.
 * Files: /sys/block/mdN/md/level (written)
 * Runs: /sbin/mdadm, /bin/echo */
TAVO_API int RAIDMigrate2RAID6(const RAIDINFO *pInfo, const TLIBSZLIST *pslMembers);

/* Checks whether all members have unused room. Returns 1 and the new size of each in KiB; 0 when they have none; -1
 * when a member's size cannot be read. Only RAID 1, 5 and 6 can grow. */
TAVO_API int RAIDExpansible(const RAIDINFO *pInfo, uint64_t *pcKibMember);

/* Computes the size in bytes to which the array can grow; its present size when it cannot. */
TAVO_API int RAIDSizeUnallocGet(const RAIDINFO *pInfo, uint64_t *pcbArray);

/* Sets the stripe cache of a RAID 5 or RAID 6 to the value for the appliance; other levels are left alone.
 * Files: /sys/block/mdN/md (written)
 * Runs: /bin/echo */
TAVO_API int TAVORAIDMdTuningPerformance(const char *szPath);

/* Sets the stripe cache, in entries. An array without one is not a failure.
 * Files: /sys/block/mdN/md (written)
 * Runs: /bin/echo */
TAVO_API int TAVORAIDMdStripeCacheSizeSet(const char *szPath, int nEntry);

/* Switches the remapping of bad sectors on or off, for all arrays. Only the appliance's kernel has the switch. */
TAVO_API int RAIDBadSectorRemap(const char *szPath, int fEnable);

TAVO_END_DECLS

#endif
