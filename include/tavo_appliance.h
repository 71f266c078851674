/*
 * Facts about the rest of the appliance: the model's limits and the hardware around it.
 *
 * /etc.defaults/tavoinfo.conf lists the model's capabilities and never changes after manufacture. Expansion units are
 * found in /sys. Nothing is locked, nothing is cached.
 */
#ifndef TAVO_APPLIANCE_H
#define TAVO_APPLIANCE_H

#include "tavo_error.h"
#include "tavo_hash.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* --- storage --- */

enum { TAVO_EBOX_DISKS = 26 };

/* An expansion unit: several disks that share one port. */
typedef struct TAVOEBOX {
    int32_t iUnit;    /* 1 for the first; its letter is the first of the disks' two */
    int32_t iPort;    /* index of the internal port that leads to it, from 0 */
    int32_t fPoweron; /* 1 when it has power */
    int32_t nDisk;
    char rgszDisk[TAVO_EBOX_DISKS][16]; /* "/dev/sdaa" */
} TAVOEBOX;

/* The number of internal bays: "maxdisks", 1 to 10; 4 when the model does not say.
 * Files: /etc.defaults/tavoinfo.conf */
TAVO_API int TAVOMaxDiskGet(void);

/* Returns 1 when the internal port iPort (from 0) leads to an expansion unit instead of a bay, else 0. Always 0 on a
 * model without "supportebox". */
TAVO_API int TAVOEBoxDevIs(int iPort);

/* Lists all expansion units in the order of their ports. *ppBox becomes a heap array that the caller releases with
 * free.
 * Returns their number; 0 with *ppBox NULL when there is none or the model does not support them; -1 with
 * ERR_BAD_PARAMETERS (ppBox is NULL), ERR_OPEN_FAILED (/sys cannot be searched) or ERR_OUT_OF_MEMORY.
 * Files: /sys/class/ata_device, /sys/class/ata_link, /sys/block */
TAVO_API int TAVOEBoxInfoEnum(TAVOEBOX **ppBox);

/* Returns 1 when the unit has power, else 0; 0 with ERR_BAD_PARAMETERS for NULL. */
TAVO_API int TAVOEBoxIsPoweron(const TAVOEBOX *pBox);

/* The largest size of an array member that the model uses, "raidsizelimit", in KiB; 0 without a limit. A limit that
 * does not fit in an unsigned long (4 TiB on the appliance) is reported as ULONG_MAX.
 * Files: /etc.defaults/tavoinfo.conf */
TAVO_API unsigned long RAIDSizeLimitGet(void);

/* --- accounts --- */

/* Renames and removes users and groups in the user lists of Samba's settings, /usr/tavo/etc/smb.conf: "valid users",
 * "invalid users", "read list", "write list" and "admin users" of every section. pshNames maps upper-case old names to
 * new names, "" removing the name; a key that begins with "@" is a group, which the file writes as "@name" or "+name".
 * The rest of the file stays unchanged, byte for byte. Hold the Samba lock.
 * Returns 0 also when there is no such file, or -1 with
 *   ERR_BAD_PARAMETERS  pshNames is NULL
 *   ERR_OPEN_FAILED, ERR_READ_FAILED, ERR_WRITE_FAILED, ERR_RENAME_FAILED  the file, which is unchanged
 * Files: /usr/tavo/etc/smb.conf */
TAVO_API int TAVOUserModifySmbConf(const TLIBSZHASH *pshNames);

/* Appends the domain accounts that are recorded as in use: the lines of /usr/tavo/etc/duser_used with a backslash.
 * Returns how many; -1 with ERR_BAD_PARAMETERS (ppList or *ppList is NULL), ERR_READ_FAILED, or the list's code.
 * Files: /usr/tavo/etc/duser_used */
TAVO_API int TAVOPushDUserUsed(TLIBSZLIST **ppList);

/* Sends the signal to the appliance's event daemon, whose process id is in /var/run/scemd.pid. Signal 47 reports that
 * accounts have changed. Returns 0 also when the daemon does not run, or -1 with ERR_SYS_UNKNOWN.
 * Files: /var/run/scemd.pid */
TAVO_API int TLIBScemdNotify(int signal);

/* Sends the signal to the download scheduler, whose process id is in /var/run/scheduler.pid. Signal 10 makes it read
 * the accounts again. Returns as TLIBScemdNotify.
 * Files: /var/run/scheduler.pid */
TAVO_API int TAVOSchedulerHup(int signal);

/* --- services --- */

/* Stops (1), starts (2), restarts (3) or reloads (4) the network-backup server, /usr/bin/rsync with
 * /usr/tavo/etc/rsyncd.conf; its process id is in /var/run/rsyncd.pid. Stopping a stopped server and starting a running
 * one succeed without doing anything.
 * Returns 0, or -1 with ERR_BAD_PARAMETERS (another operation) or ERR_OP_FAILURE.
 * Files: /var/run/rsyncd.pid
 * Runs: /usr/bin/rsync */
TAVO_API int TAVONetBkpService(int operation);

TAVO_END_DECLS

#endif
