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

/* What there is to know about an array. */
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

/* How far a rebuild has come. 20 bytes without padding: copy the 64-bit fields out, take no pointer to them. */
typedef struct __attribute__((packed)) RAIDPROGRESS {
    int32_t nState;  /* 0 none is running, 1 running, 2 running and nothing finished yet */
    int64_t cDone;   /* sectors */
    int64_t cSector; /* sectors in all */
} RAIDPROGRESS;

typedef struct RAIDVERSION {
    int32_t nMajor;
    int32_t nMinor;
} RAIDVERSION;

/* What RAIDCreate is to make. */
typedef struct RAIDREQUEST {
    const char *szPath;
    const RAIDVERSION *pVersion; /* of the superblock; NULL for 1.1 */
    int32_t fLevel;              /* RAID_LEVEL_ */
    int32_t nSpare;
    int32_t nSlot;                                /* at least 1; slots without a member are left missing */
    uint64_t cbArray __attribute__((aligned(8))); /* bytes to use on each member; 0: all, or the model's limit */
    const TLIBSZLIST *pslMembers;                 /* the spares are the last ones */
    int32_t fSync;                                /* 0: take the members as being in sync */
} RAIDREQUEST;

/* --- reading arrays --- */

/* Reads an array. *ppInfo is a new record for RAIDInfoFree. Returns 1; 0, silently, when there is no such array or it
 * does not run; -1, logged, with *ppInfo untouched and
 *   ERR_BAD_PARAMETERS   an argument is NULL or szPath is no array (not logged)
 *   ERR_OPEN_FAILED      the device
 *   ERR_SIZE_UNKNOWN     the driver does not describe it
 *   ERR_UNKNOWN          its level is none of RAID_LEVEL_
 *   ERR_OUT_OF_MEMORY
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDInfoGet(const char *szPath, RAIDINFO **ppInfo);

/* A copy of the record with its members, for RAIDInfoFree. NULL with ERR_BAD_PARAMETERS or ERR_OUT_OF_MEMORY. */
TAVO_API RAIDINFO *RAIDInfoDup(const RAIDINFO *pInfo);
TAVO_API void RAIDInfoFree(RAIDINFO *pInfo);

/* Reads all arrays. Returns the number of records and puts the list, NULL for none, into *ppList, for RAIDListFree; -1
 * with *ppList NULL: ERR_BAD_PARAMETERS, or logged with a code of RAIDPathEnum or RAIDInfoGet. An array that goes while
 * it is read is passed over.
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDInfoEnum(RAIDLIST **ppList);

/* Appends the paths of all arrays in /sys/block, by number, to the caller's list, which may move. Returns how many; -1
 * with ERR_BAD_PARAMETERS, ERR_OPEN_FAILED or ERR_OUT_OF_MEMORY.
 * Files: /sys/block/mdN/md */
TAVO_API int RAIDPathEnum(TLIBSZLIST **ppList);

/* Appends a node with pInfo, which then belongs to the list. Returns 0, or -1 with ERR_BAD_PARAMETERS or
 * ERR_OUT_OF_MEMORY; pInfo is still the caller's then. */
TAVO_API int RAIDListPush(RAIDLIST **ppList, RAIDINFO *pInfo);
TAVO_API int RAIDListCount(const RAIDLIST *pList);

/* Finds the array with that path: returns 1 and the record, which stays the list's, in *ppInfo; 0 without one; -1 with
 * ERR_BAD_PARAMETERS. */
TAVO_API int RAIDListSearch(const RAIDLIST *pList, const char *szPath, RAIDINFO **ppInfo);
TAVO_API void RAIDListFree(RAIDLIST *pList); /* with the records */

/* Decides the health of an array from the kernel's description (its level and number of slots) and its members. Returns
 * 0, or -1, logged, for a level that is none of RAID_LEVEL_; with ERR_BAD_PARAMETERS for a NULL argument (pMembers may be
 * NULL: no members). */
TAVO_API int RAIDStatusDecide(const struct mdu_array_info_s *pArray, const RAIDMEMBER *pMembers, int *pStatus);

/* The number of disks whose loss the level survives at best, among nDisk; -1 for an unknown level. */
TAVO_API int RAIDParityDiskCount(int fLevel, int nDisk);

/* The number of members whose state is among the RAID_MEMBER_ bits of fState. */
TAVO_API int RAIDDiskCount(const RAIDMEMBER *pMembers, int fState);

/* Asks the appliance's driver for an open array's health. Returns 0, or -1 with ERR_PATH_NOT_FOUND (the array does not
 * run), ERR_UNKNOWN (logged: another answer, or a driver without this request) or ERR_BAD_PARAMETERS. */
TAVO_API int RAIDIoctlStatus(int fd, int *pStatus);

/* Asks the appliance's driver how far the rebuild of an open array has come. Returns 0, or -1 as RAIDIoctlStatus. */
TAVO_API int RAIDRebuildStatusGet(int fd, RAIDPROGRESS *pProgress);

/* Waits, for hours if need be, until an array is no longer being rebuilt; looks every 30 seconds. Returns 0 when its
 * status is normal then, else -1, logged: it is not, or the array could not be read five times in a row. */
TAVO_API int RAIDRebuildingWait(const char *szPath);

/* The same for each path in turn; stops at the first failure, logged. */
TAVO_API int RAIDRebuildingMultiWait(const TLIBSZLIST *pslPaths);

/* The stripe size in KiB: chunk size times data members; 0 for RAID 1 and linear. -1: ERR_OPEN_FAILED (the chunk size
 * cannot be read, or there is no such array), a code of RAIDInfoGet, or, logged, another level. */
TAVO_API int RAIDMdStripeSizeGet(const char *szPath);

/* --- superblocks --- */

/* Reads the superblock of a member with "mdadm -E" into the caller's record. Returns 1 when mdadm said anything, which it
 * also does of a partition table: look at szUuid; 0 when it did not, with the record cleared; -1, logged, when it could
 * not be run; with ERR_BAD_PARAMETERS for a NULL argument or text that is no device. A line that cannot be understood is
 * logged and ends the reading.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBGet(const char *szMember, RAIDSUPERBLOCK *pSuperblock);

/* Reads the superblocks of several members as a heap array for free; those without one are left out. Returns their
 * number, 0 with *ppEntry NULL; -1 with ERR_BAD_PARAMETERS, ERR_OUT_OF_MEMORY, or as RAIDSBGet.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBEnum(const TLIBSZLIST *pslMembers, RAIDSBENTRY **ppEntry);

/* Erases the superblock of a member. Returns 0 or -1, logged.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDSBClean(const char *szMember);

/* Erases the superblocks of all disks and partitions that belong to the array with that UUID, in whole. Stop the array
 * first. pInfo is not looked at and may be NULL. Returns 0, or -1, logged, at the first failure; with ERR_BAD_PARAMETERS,
 * before any disk is touched, for text that is no UUID.
 * Files: /proc/partitions
 * Runs: /bin/grep, /sbin/mdadm */
TAVO_API int RAIDSBCleanByUUID(const RAIDINFO *pInfo, const char *szUuid);

/* Gives the UUID of a running array, from a member's superblock. Returns 1; 0 when no member has one; -1 with
 * ERR_BAD_PARAMETERS, ERR_NOT_ENOUGH_MEMORY (cbUuid is too small), or a code of RAIDInfoGet.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDUUIDGet(const char *szPath, char *szUuid, int cbUuid);

/* Tells whether the disk szDisk ("/dev/sda") is a member of an array: by its partition 3 or 5, or as a whole, which only
 * counts for arrays above 100. Returns 1 and the array's number in *pnArray, which may be NULL; 0; -1 when a superblock
 * cannot be read, or with ERR_BAD_PARAMETERS.
 * Runs: /sbin/mdadm */
TAVO_API int RAIDDiskIsUsedByRAID(const char *szDisk, int *pnArray);

/* --- changing arrays. All return 0, or -1, logged; ERR_BAD_PARAMETERS for an argument that is no array or device --- */

/* Creates an array and tunes it. What is on the members is lost.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDCreate(const RAIDREQUEST *pRequest);

/* Starts an array from the members that carry its UUID, or from the members of a record. When not all members of the record
 * are there, but enough of them that the array is degraded, it is started by their UUID.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDAssemble(const char *szPath, const char *szUuid);
TAVO_API int RAIDAssembleByInfo(const RAIDINFO *pInfo);

/* Stops an array; its members keep their superblocks.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDStop(const char *szPath);

/* Stops an array and erases the superblocks of its members. Also of a list; one that does not exist is passed over, and
 * the others are removed also when one fails.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDRemove(const RAIDINFO *pInfo);
TAVO_API int RAIDRemoveMultiple(const TLIBSZLIST *pslPaths);

/* Adds a member: as a spare, which is rebuilt onto when one is missing; to a linear array at its end. Impossible for
 * RAID 0. Of the record the path and level are used.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDAdd(const RAIDINFO *pInfo, const char *szMember);

/* The same, after a look whether the member is large enough:
 *   ERR_NOT_ENOUGH_SPACE   it is not
 *   ERR_PATH_NOT_FOUND     it is absent
 *   ERR_SYS_UNKNOWN        its size cannot be read, or adding failed */
TAVO_API int RAIDAddRobustCheck(const RAIDINFO *pInfo, const char *szMember);

/* Removes a failed or spare member, and makes sure that it is gone. A member whose disk was pulled has no node any more;
 * its path is "/dev/" and the name that the kernel keeps for it, and it is removed whatever its state.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDRemoveDisk(const RAIDINFO *pInfo, const char *szMember);

/* Puts a new disk into the place of a member of a RAID 1, 5, 6 or 10; the rebuild begins, RAIDRebuildingWait waits for it.
 * szOld is the path of the member that goes: failed, a spare, or of a disk that was pulled; NULL for the only one that is
 * failed or pulled, or, without one, for a free slot. szNew is the whole disk ("/dev/sdd"). It gets the partitions of the
 * system as the disk of another member has them, unless it has them already, and the one of the same number joins the
 * array; in an array of whole disks the disk does. What was on them is lost, superblocks included. Log lines say what was
 * done.
 *   ERR_BAD_PARAMETERS     an array, level or path that is none of these
 *   ERR_NOT_ENOUGH_SPACE   the new disk is too small; nothing has changed
 *   ERR_SYS_UNKNOWN        mdadm did not take the new member; the old one is gone and the disk partitioned
 * -1 without a code, logged, with nothing changed: the choice of the old one is not clear or it is in order, the new disk
 * is in use, or no other member's disk shows how to partition it.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDReplaceDisk(const RAIDINFO *pInfo, const char *szOld, const char *szNew);

/* Changes the number of slots.
 * Files: /sys/block/mdN/md
 * Runs: /sbin/mdadm */
TAVO_API int RAIDDevCountChange(const RAIDINFO *pInfo, int nSlot);

/* Turns a RAID 5 into a RAID 6 with new members. With more than one it waits for the first one's rebuild, adds the others
 * and sets the number of slots to the number of new members minus 1, which mdadm refuses when that is fewer than before.
 * -1 with nothing changed when a new member is in use or too small.
 * Files: /sys/block/mdN/md/level (written)
 * Runs: /sbin/mdadm, /bin/echo */
TAVO_API int RAIDMigrate2RAID6(const RAIDINFO *pInfo, const TLIBSZLIST *pslMembers);

/* Tells whether all members have room to use more of: returns 1 and the size to use on each, in KiB; 0; or -1 when a
 * member's size cannot be read. Only RAID 1, 5 and 6 can grow. */
TAVO_API int RAIDExpansible(const RAIDINFO *pInfo, uint64_t *pcKibMember);

/* Gives the size in bytes that the array can grow to, or has. */
TAVO_API int RAIDSizeUnallocGet(const RAIDINFO *pInfo, uint64_t *pcbArray);

/* Sets the stripe cache of a RAID 5 or RAID 6 to what suits the appliance; leaves other levels alone.
 * Files: /sys/block/mdN/md (written)
 * Runs: /bin/echo */
TAVO_API int TAVORAIDMdTuningPerformance(const char *szPath);

/* Sets the stripe cache, in entries. An array without one is no failure.
 * Files: /sys/block/mdN/md (written)
 * Runs: /bin/echo */
TAVO_API int TAVORAIDMdStripeCacheSizeSet(const char *szPath, int nEntry);

/* Switches the remapping of bad sectors on or off, for all arrays. Only the appliance's kernel has the switch. */
TAVO_API int RAIDBadSectorRemap(const char *szPath, int fEnable);

TAVO_END_DECLS

#endif
