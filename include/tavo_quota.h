/*
 * Quotas: limits on the space that a user may take on a volume.
 *
 * The volume N is mounted at /volumeN; its quotas are those of the kernel for users (quota format "vfsv0"), set and
 * read with quotactl(2) on the volume's block device, and switched by the standard quota tools (mount, quotacheck,
 * quotaon, quotaoff). Groups have no limits here. Limits are given in megabytes of 1024 KiB; the kernel counts KiB.
 *
 * Changing needs root. Nothing is locked. Functions return 0, or -1 with the code set, unless said otherwise.
 */
#ifndef TAVO_QUOTA_H
#define TAVO_QUOTA_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* The result of TAVOQuotaGet. */
typedef struct TAVOQUOTA {
    float rLimit;    /* megabytes; 0 without a limit */
    uint64_t cbUsed; /* bytes in use */
} TAVOQUOTA;

/* The conversions of TAVOUnitTrans. */
enum {
    TAVO_UNIT_MB_TO_BYTE = 0,
    TAVO_UNIT_BYTE_TO_MB = 1,
    TAVO_UNIT_BYTE_TO_KB = 2,
    TAVO_UNIT_KB_TO_BYTE = 3,
    TAVO_UNIT_MB_TO_KB = 4,
    TAVO_UNIT_KB_TO_MB = 5
};

/* Converts between units; returns 0 for a mode that is not one of TAVO_UNIT_. Sets no code. */
TAVO_API float TAVOUnitTrans(int mode, float value);

/* Returns 1 when "supportquota" is "yes" (any case) in /etc.defaults/tavoinfo.conf, else 0.
 * Files: /etc.defaults/tavoinfo.conf */
TAVO_API int TAVOSupportQUOTA(void);

/* Switches quotas on for the volume: remounts it with quotas, builds the quota files, has the kernel use them. A
 * failing step does not undo the steps before it.
 * Fails with
 *   ERR_BAD_PARAMETERS  no volume of this number is mounted; nothing was run
 *   ERR_QUOTA_REMOUNT   the volume cannot be remounted
 *   ERR_QUOTA_CHECK     the quota files cannot be built; also while another process writes to the volume
 *   ERR_QUOTA_ON        the kernel does not take them
 *   ERR_QUOTA_SHELL     a command could not be run, or was killed
 * Files: /proc/mounts
 * Runs: /bin/mount, /sbin/quotacheck, /sbin/quotaon */
TAVO_API int TAVOQuotaInit(int nVolume);

/* Switches quotas off for the volume. Fails with ERR_BAD_PARAMETERS and ERR_QUOTA_SHELL as above, and with
 * ERR_QUOTA_OFF when quotaoff fails.
 * Files: /proc/mounts
 * Runs: /sbin/quotaoff */
TAVO_API int TAVOQuotaOff(int nVolume);

/* Sets the limit of a user, in megabytes, on the volume whose block device is szDevice; 0 removes the limit. It is
 * the hard and the soft limit; the number of files is not limited.
 * Fails with
 *   ERR_BAD_PARAMETERS      the name or the device is NULL or empty; the limit is NULL, negative, not a number or too
 *                           large to count in bytes
 *   ERR_NO_SUCH_USER        there is no such user
 *   ERR_QUOTA_NOT_ENABLED   the volume has no quotas
 *   ERR_FILE_NOT_FOUND      there is no such device
 *   ERR_QUOTA_BAD_ARGUMENT  the kernel refused the limit or the device
 *   ERR_SYS_UNKNOWN         the name is that of a group, or anything else went wrong
 * or as TAVOUserGet when the account cannot be looked up.
 * Files: /etc/passwd, /tmp/.db.user.*
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOQuotaSet(const char *szUser, const char *szDevice, const float *prLimit);

/* Reads limit and use of a user. Fails, *pQuota untouched, with
 *   ERR_BAD_PARAMETERS     the name or the device is NULL or empty, or pQuota NULL
 *   ERR_NO_SUCH_USER       there is no such user
 *   ERR_QUOTA_NOT_ENABLED  the volume has no quotas
 *   ERR_SYS_UNKNOWN        the name is that of a group, or anything else went wrong
 * or as TAVOUserGet when the account cannot be looked up.
 * Files: /etc/passwd, /tmp/.db.user.*
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOQuotaGet(const char *szUser, const char *szDevice, TAVOQUOTA *pQuota);

/* Returns the number of the quota format that the kernel uses on the device: 1 (old), 2 (vfsv0), 4 (vfsv1). Fails with
 * ERR_BAD_PARAMETERS (szDevice NULL or empty), ERR_QUOTA_NOT_ENABLED or ERR_SYS_UNKNOWN. */
TAVO_API int TAVOQuotaFmtGet(const char *szDevice);

/* Removes the limits of the listed users on one device; empty names are skipped. Continues after a failure and then
 * fails with the code of the last one, as TAVOQuotaSet. ERR_BAD_PARAMETERS when the list is NULL.
 * Files: /etc/passwd, /tmp/.db.user.*
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOQuotaClean(const TLIBSZLIST *pslUsers, const char *szDevice);

/* The same on every volume that is mounted with quotas for users (the mount options in /proc/mounts). Each volume
 * that fails is logged. ERR_READ_FAILED when the mounts cannot be read.
 * Files: /proc/mounts, /etc/passwd, /tmp/.db.user.*
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOQuotaCleanAllVols(const TLIBSZLIST *pslUsers);

TAVO_END_DECLS

#endif
