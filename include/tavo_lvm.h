/*
 * LVM: physical volumes, volume groups and logical volumes on the data arrays.
 *
 * On models with RAID every data array is a physical volume; those of one storage space form a volume group, whose path
 * starts with "/dev/vg", and one logical volume fills it. Models without RAID do not use LVM: there the reading functions
 * find nothing and run no tool.
 *
 * A physical volume is "/dev/" and a kernel name. A volume group is "/dev/vg" and letters, digits, "_.+-". Other text
 * is refused before any program runs. The LVM tools do all the work. Nothing is locked. Failures are logged; a code is
 * recorded only where one is named.
 *
 * A device or a group that is larger than the kernel can reach as one volume (16 TiB with a 32-bit one) is refused before
 * anything is written: -1, logged.
 */
#ifndef TAVO_LVM_H
#define TAVO_LVM_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

typedef struct LVMPV {
    char szPv[128];   /* "/dev/md2" */
    char szVg[128];   /* "/dev/vg1"; empty without a group, and for a group whose name does not start with "vg" */
    char szUuid[256]; /* of the group */
    int32_t nPv;      /* physical volumes of the group */
} LVMPV;

typedef struct LVMPVLIST {
    LVMPV pv;
    struct LVMPVLIST *pNext;
} LVMPVLIST;

typedef struct LVMVG {
    char szVg[128];
    char szUuid[256];
} LVMVG;

typedef struct LVMVGINFO {
    char szVg[128];
    char szUuid[256];
    int32_t nPv;
    int32_t fValid;     /* 1 when LVMVgSB2Info has filled it */
    TLIBSZLIST *pslPvs; /* belongs to the record; may move */
} LVMVGINFO;

typedef struct LVMVGLIST {
    LVMVGINFO *pInfo;
    struct LVMVGLIST *pNext;
} LVMVGLIST;

/* The key of LVMVgSBListSearch; either pointer may be NULL. */
typedef struct LVMVGKEY {
    const char *szVg;
    const char *szPv;
} LVMVGKEY;

/* Returns 1 when the model uses LVM, else 0. */
TAVO_API int LVMIsSupport(void);

/* --- physical volumes --- */

/* Makes a physical volume; the data on the device is lost. Returns 0 or -1.
 * Runs: /sbin/pvcreate */
TAVO_API int LVMPvCreate(const char *szDevice);

/* Grows every physical volume of the group to the size of its device. Returns 0; -1 when one failed, after the others
 * have been grown.
 * Runs: /sbin/pvresize */
TAVO_API int LVMPvExpand(const LVMVGINFO *pInfo);

/* Reads one physical volume into the caller's record. Returns 1; 0 when the device is not a physical volume; -1 on
 * failure. The record is written only when 1 is returned.
 * Runs: /sbin/pvs */
TAVO_API int LVMPvSBGet(const char *szDevice, LVMPV *pPv);

/* Reads all physical volumes. Returns their number and stores the list (NULL for none) in *ppList; the caller releases
 * it with LVMPvSBListFree. Returns -1 with *ppList NULL on failure.
 * Runs: /sbin/pvs */
TAVO_API int LVMPvSBEnum(LVMPVLIST **ppList);

/* Parses a line "  PV|VG|UUID|COUNT" of pvs. Returns 0; -1, silently and with the record untouched, for other text. */
TAVO_API int LVMPvParseLine(const char *szLine, LVMPV *pPv);

/* Appends a copy of the record. Returns 0 or -1. */
TAVO_API int LVMPvSBListPush(LVMPVLIST **ppList, const LVMPV *pPv);
TAVO_API void LVMPvSBListFree(LVMPVLIST *pList);

/* Scans the system for physical volumes again. Returns 0 or -1.
 * Runs: /sbin/pvscan */
TAVO_API int LVMPvScan(void);

/* Removes a physical volume, even one that belongs to a group. Returns 0 or -1.
 * Runs: /sbin/pvremove */
TAVO_API int LVMPvRemove(const char *szDevice);

/* --- volume groups --- */

/* Makes a group of physical volumes. After a first failure it tries once more. Returns 0 or -1.
 * Runs: /sbin/vgcreate */
TAVO_API int LVMVgCreate(const char *szVg, const TLIBSZLIST *pslDevices);

/* Removes a group, and its directory in /dev. Returns 0 or -1.
 * Runs: /sbin/vgremove, /bin/rm */
TAVO_API int LVMVgRemove(const char *szVg);

/* Renames a group, given by its path or, when szVg is NULL, by its name. Returns 0 or -1.
 * Runs: /sbin/lvm */
TAVO_API int LVMVgRename(const char *szVg, const char *szOldName, const char *szNewName);

/* Reads a group. Returns 1; 0 when there is no such group; -1 on failure. The record is written only when 1 is
 * returned.
 * Runs: /sbin/vgs */
TAVO_API int LVMVgSBGet(const char *szVg, LVMVG *pVg);

/* Returns an empty record that the caller releases with LVMVgInfoFree; NULL with ERR_OUT_OF_MEMORY. */
TAVO_API LVMVGINFO *LVMVgInfoAlloc(void);
TAVO_API void LVMVgInfoFree(LVMVGINFO *pInfo);

/* Fills the record with a group and its physical volumes. Returns 0, or -1 with the record unchanged: also for a group
 * without a UUID, which devices outside every group would match. */
TAVO_API int LVMVgSB2Info(const LVMVG *pVg, LVMVGINFO *pInfo);

/* Finds the first group that has the key's path or holds its physical volume. Returns 1 and the record, which the list
 * still owns, in *ppFound; 0 without one; -1 for a NULL argument (pList may be NULL). */
TAVO_API int LVMVgSBListSearch(const LVMVGLIST *pList, const LVMVGKEY *pKey, LVMVGINFO **ppFound);

/* --- logical volumes --- */

/* Makes the volume that fills the group; signatures of an earlier volume there are wiped. Returns 0 or -1.
 * Runs: /sbin/lvcreate */
TAVO_API int LVMLvCreate(const char *szVg, const char *szLv);

/* Makes physical volumes of all devices, in order, a group of them, and its volume. The group's UUID is copied to
 * szUuid unless that is NULL, cut to cbUuid bytes with the final NUL. Returns 0, or -1 at the first failure.
 * Runs: /sbin/pvcreate, /sbin/vgcreate, /sbin/lvcreate */
TAVO_API int LVMCreate(const TLIBSZLIST *pslDevices, const char *szVg, const char *szLv, char *szUuid, int cbUuid);

/* Copies the path of the first logical volume on a device, "/dev/vg1/lv", to szPath. Returns 1; 0 when there is none;
 * -1 when szPath is too small (ERR_NOT_ENOUGH_MEMORY) or an argument is bad. */
TAVO_API int LVMGetLVPath(const char *szDevice, char *szPath, int cbPath);

/* Removes the logical volume of a device with its mounted snapshots ("lv", "s" and a number), the group and the
 * physical volume. A step that fails is logged, and the next one follows. Returns 0; -1 for a bad argument.
 * Files: /proc/mounts
 * Runs: /bin/umount, /sbin/lvremove, /sbin/vgremove, /sbin/pvremove */
TAVO_API int LVMRemoveLV(const char *szDevice);

/* Removes the logical volumes of a group. szKind is "lv". Returns 0 or -1.
 * Runs: /sbin/lvremove */
TAVO_API int LVMRemove(const char *szVg, const char *szKind);

/* Removes every physical volume on a disk or a partition ("/dev/sd"): the appliance has them on arrays only. USB disks,
 * and groups that include one, are left alone. Does nothing on a model without LVM. Returns 0; -1 when the physical
 * volumes cannot be listed, or, with nothing changed, when one of them is mounted or otherwise in use, which is logged.
 * Files: /sys/class/block, /dev/mapper
 * Runs: /sbin/pvs */
TAVO_API int LVMCleanIllegal(void);

TAVO_END_DECLS

#endif
