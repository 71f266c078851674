/*
 * RAID: the md arrays that the appliance's disks are joined into.
 */
#ifndef TAVO_RAID_H
#define TAVO_RAID_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/* Tells whether the disk szDisk ("/dev/sda") is a member of an array, by its data partition or as a whole. Returns 1 and
 * the array's number in *pnArray, 0, or -1. */
TAVO_API int RAIDDiskIsUsedByRAID(const char *szDisk, int *pnArray);

TAVO_END_DECLS

#endif
