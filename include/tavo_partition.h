/*
 * Partitions: the layouts that the system disks carry and have carried, and making and removing them.
 *
 * Partition 1 of a system disk holds the system, partition 2 is swap, partition 3 takes the rest for data; on models
 * with RAID each is a member of an array. The exact sectors have changed over the years: every geometry ever shipped
 * is listed in grgAllTavoPartLayout and is recognised. The table is an MS-DOS one, on disks of more than 2^32 sectors a
 * GUID partition table. A disk that is larger than the kernel can reach (16 TiB with a 32-bit one) is refused before
 * anything is written, which is logged.
 *
 * Changes are made by the appliance's own /sbin/sfdisk. A disk is "/dev/sda"; text that is not a device name (see
 * tavo_disk.h) is refused before any program runs. Nothing is locked. All failures are logged; none of these functions
 * records a code itself, but a function of tavo_disk.h that it calls may.
 */
#ifndef TAVO_PARTITION_H
#define TAVO_PARTITION_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* One partition of a layout: 20 bytes. */
typedef struct __attribute__((packed)) TAVOPARTPLACE {
    int64_t nStart;  /* sectors of 512 bytes; -1 in partition 3: where partition 2 and the gap end */
    int64_t cSector; /* -1: to the end of the disk */
    uint32_t nType;  /* of the MS-DOS table */
} TAVOPARTPLACE;

/* One layout: 92 bytes without padding. Its 64-bit fields are aligned only to 4 bytes, so copy them out (memcpy, or a
 * plain assignment) and take no pointer to them. */
typedef struct __attribute__((packed)) TAVOPARTLAYOUT {
    int32_t nVersion;
    uint32_t fRaid;    /* 1: the partitions are members of arrays */
    uint64_t cSector1; /* creating: size of partition 1 in sectors */
    uint64_t cSector2; /* creating: size of partition 2 */
    uint64_t cGap;     /* creating: sectors left free before partition 3 */
    TAVOPARTPLACE place1;
    TAVOPARTPLACE place2;
    TAVOPARTPLACE place3;
} TAVOPARTLAYOUT;

/* Every layout ever shipped; no terminator. 920 bytes. */
extern TAVO_API const TAVOPARTLAYOUT grgAllTavoPartLayout[10];

/* One partition type of an MS-DOS table. */
typedef struct PARTTYPE {
    uint32_t nType;
    const char *szName; /* NULL ends the table; a type of 0 does not, it is the first row */
    uint32_t fWindows;  /* 1 for a type that holds FAT or NTFS */
} PARTTYPE;

/* Every type that has a name; the last row ends the table. */
extern TAVO_API const PARTTYPE PartType[49];

/* The layout version of new disks when no other version is recognised. */
enum { PARTITION_VERSION_CURRENT = 7 };

/* The partitions that PartitionCreate makes. Create the two in two calls, system first: with both flags only the data
 * partition is made, and PARTITION_SYSTEM writes an empty table first, so that an existing data partition is removed.
 * */
enum {
    PARTITION_SYSTEM = 1, /* partitions 1 and 2; for PartitionClean too */
    PARTITION_DATA = 2    /* partition 3; for PartitionClean partitions 3 to 15 */
};

/* Results of PartitionTableTypeGet. */
enum { PARTITION_TABLE_NONE = 1, PARTITION_TABLE_MBR = 2, PARTITION_TABLE_GPT = 3 };

/* The filter of PartitionPathEnum. */
typedef struct PARTITIONFILTER {
    const char *szPrefix; /* of the kernel name: "sda"; NULL or "" for any */
    int32_t fContainer;   /* DISK_CONTAINER_ bits of tavo_disk.h; 0 for any */
} PARTITIONFILTER;

/* Returns 1 when partitions 1 and 2 of the disk have exactly the sectors and types of a layout with that RAID flag, and
 * writes its version to *pVersion unless that is NULL; 0 otherwise. The source is sfdisk.
 * Runs: /sbin/sfdisk */
TAVO_API int BlTAVOCheckPartitionLayout(const char *szDisk, int fRaid, int *pVersion);

/* Returns the index of the layout in grgAllTavoPartLayout; version 0 means the current one. -1, silently, when there is
 * no such layout. */
TAVO_API int TAVOPartitionLayoutIdxGet(int version, int fRaid);

/* Finds the layout version of the system disks: that of a member of the system array /dev/md0; without such members
 * that of an internal disk; PARTITION_VERSION_CURRENT when none is recognised. Returns 0, or -1 when /sys/block/md0
 * cannot be searched or pVersion is NULL.
 * Files: /sys/block/md0/md
 * Runs: /sbin/sfdisk */
TAVO_API int PartitionLayoutGet(int *pVersion);

/* Creates partitions. flags are PARTITION_SYSTEM and PARTITION_DATA (0: nothing is made); pVersion may be NULL for the
 * version of the system disks. The data on the disk is lost. Returns 0 or -1. While the disk is in use (PARTITION_DATA:
 * partition 3) nothing is changed and the use is logged.
 * Files: /sys/class/block
 * Runs: /sbin/sfdisk */
TAVO_API int PartitionCreate(const char *szDisk, int flags, const int *pVersion);

/* Empties entries of the table and erases RAID superblocks of the partitions. PARTITION_DATA empties partitions 15 down
 * to 3 (missing ones are skipped) and erases the superblock of partition 3; PARTITION_SYSTEM does both for
 * partitions 1 and 2 and leaves an empty table, without partition 3 too. The superblock of another partition that is
 * emptied is erased first. Returns 0 or -1. While one of the partitions that the call empties (PARTITION_SYSTEM empties
 * all) is in use nothing is changed and the use is logged.
 * Files: /sys/class/block
 * Runs: /sbin/sfdisk, /sbin/mdadm */
TAVO_API int PartitionClean(const char *szDisk, int flags);

/* Erases the RAID superblock of one partition. Returns 0 or -1.
 * Runs: /sbin/mdadm */
TAVO_API int PartitionCleanRAID(const char *szDisk, int nPartition);

/* Writes an empty partition table. Returns 0 or -1.
 * Runs: /sbin/sfdisk */
TAVO_API int PartitionAddTable(const char *szDisk);

/* Returns the size of partition nPartition in sectors, and its start and type through the pointers, which may be NULL.
 * -1, silently, when there is no such partition or an argument is bad. szDisk may lack its "/dev/".
 * Runs: /sbin/sfdisk */
TAVO_API int64_t RCPartitionConfigs(int nPartition, const char *szDisk, int64_t *pnStart, uint32_t *pnType);

/* Returns 1 when the partition szPath ("/dev/sda4") is of type 0x0F, extended, else 0. Types 0x05 and 0x85 do not
 * count. */
TAVO_API int PartitionIsExtended(const char *szPath);

/* Stores the kind of the partition table, PARTITION_TABLE_, in *pKind. Every call writes a line to the log. Returns 0,
 * or -1 when the first sector cannot be read. Entry 3 of the table is not read. */
TAVO_API int PartitionTableTypeGet(const char *szPath, int *pKind);

/* Sorts the caller's list *ppList and adds the paths of all disks and partitions of /proc/partitions that pass the
 * filter. The list may move. Returns the number of items of the list, or -1 (the list may then hold a part of the
 * paths).
 * Files: /proc/partitions */
TAVO_API int PartitionPathEnum(const PARTITIONFILTER *pFilter, TLIBSZLIST **ppList);

/* Returns the number of the partition that holds the data of a known USB device with a fixed layout, -1 for any other
 * device. The source is the USB device of the disk in /sys. */
TAVO_API int TAVOCheckSpecialDevice(const char *szDisk);

TAVO_END_DECLS

#endif
