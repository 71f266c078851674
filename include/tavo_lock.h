/*
 * Advisory locks: the lock files by which all programs of the appliance take turns at its shared system files.
 *
 * A program takes the locks of the files that it is about to read or change, works, and releases them:
 *
 *     if (ErrTLIBFileLock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5) != 0)
 *         return -1;
 *     ...
 *     ErrTLIBFileUnlock(TAVO_LOCK_TAVOINFO);
 *
 * Locks nest within one process: each needs as many unlocks as there were locks. Processes exclude each other, threads
 * of one process do not. When a process ends, in whatever way, its locks are released.
 *
 * The locks are flock(2) locks on the files /tmp/lock/lock_*. They belong to the open file, which a forked child
 * shares: a child first calls ErrTLIBFileCloseLock or ErrTLIBFileResetLock, never ErrTLIBFileUnlock, which would
 * release the parent's locks. Executed programs inherit none, because the files are close-on-exec.
 *
 * Only the owner of a lock file may open it (mode 0600), because everybody who can open a file can hold its lock. On
 * the appliance that owner is root, so the requests of another user's program fail at once with ERR_LOCK_FAILED. So
 * does every function of the library that needs a lock, including those that only read.
 *
 * A request that fails names the lock in the system log, with the process id and the name of a holder if /proc/locks
 * shows one.
 *
 * Files: /tmp/lock/lock_* (created, locked)
 */
#ifndef TAVO_LOCK_H
#define TAVO_LOCK_H

#include "tavo_error.h"

#include <stdio.h>

TAVO_BEGIN_DECLS

/*
 * A request combines the wanted locks with one way to take them. A request for several locks takes all or none.
 *
 * TAVO_LOCK_HOST protects the settings of the network interfaces; TAVO_LOCK_NETWORK is another lock.
 * The services take TAVO_LOCK_TAVOINFO, TAVO_LOCK_SMB and TAVO_LOCK_APPLE together and hold them while start-up scripts
 * run: such a script must not run a program that takes one of these locks, because it would wait until its time-out.
 */
/* clang-format off */
enum {
    TAVO_LOCK_SHARED       = 0x1,      /* with other holders that share */
    TAVO_LOCK_EXCLUSIVE    = 0x2,      /* alone */
    TAVO_LOCK_NONBLOCKING  = 0x4,      /* added to one of the two: the time-out counts; without it a wait has no end */

    TAVO_LOCK_USER         = 0x10,     /* lock_pw */
    TAVO_LOCK_GROUP        = 0x20,     /* lock_gr */
    TAVO_LOCK_SMB          = 0x40,     /* lock_smb */
    TAVO_LOCK_RC           = 0x80,     /* lock_rc */
    TAVO_LOCK_HOST         = 0x100,    /* lock_host */
    TAVO_LOCK_EXPORTS      = 0x200,    /* lock_exports */
    TAVO_LOCK_NETWORK      = 0x400,    /* lock_nw */
    TAVO_LOCK_TAVOINFO     = 0x800,    /* lock_tavoinfo: /etc/tavoinfo.conf */
    TAVO_LOCK_APPLE        = 0x1000,   /* lock_apple */
    TAVO_LOCK_SNMP         = 0x2000,   /* lock_snmp */
    TAVO_LOCK_WIN          = 0x4000,   /* lock_win */
    TAVO_LOCK_TAPE_BACKUP  = 0x8000,   /* lock_tapebkp */
    TAVO_LOCK_CONNECT      = 0x10000,  /* lock_connect */
    TAVO_LOCK_USB_ID_MAP   = 0x20000,  /* lock_usbidmap */
    TAVO_LOCK_DOMAIN_UID   = 0x40000,  /* lock_duseruid */
    TAVO_LOCK_DOMAIN_GID   = 0x80000,  /* lock_dusergid */
    TAVO_LOCK_FSTAB        = 0x100000, /* lock_fstab */
    TAVO_LOCK_HOTSWAP      = 0x200000, /* lock_hotswap */
    TAVO_LOCK_SPACE        = 0x400000, /* lock_space */
    TAVO_LOCK_TTYS1        = 0x800000  /* lock_ttys1 */
};
/* clang-format on */

/* One lock as this process holds it. */
typedef struct TLIBLOCKFILE {
    FILE *pfLock;          /* the open lock file while this process holds the lock, else NULL */
    const char *szPath;    /* the lock file */
    unsigned int fLockBit; /* the lock's bit in a request; 0 ends the table */
    int nRef;              /* how many unlocks it takes to release it */
    int nMode;             /* how the lock was taken: the low four bits of that request */
} TLIBLOCKFILE;

/* The locks of this process, in the order in which a request takes them. The last record has an empty path and the bit
 * 0. Do not write to it: that breaks the locks of this process, though not those of others. */
extern TAVO_API TLIBLOCKFILE rgslckList[21];

/* Takes every lock of the request in the order of rgslckList. A lock that this process holds already is counted once
 * more, whatever the mode of the request; but a shared lock does not become exclusive: such a request fails at once and
 * changes nothing.
 * timeout: seconds for which a request with TAVO_LOCK_NONBLOCKING is tried again, every 50 milliseconds (20 times a
 * second); 0 or less means one attempt.
 * Creates /tmp/lock (mode 0755) and the lock files (mode 0600) when they are missing. A lock file that was replaced
 * while it was waited for (by a cleaner of /tmp) is opened again, so that all holders hold the same file.
 * Returns 0, or -1 with nothing taken and
 *   ERR_LOCK_FAILED    not all of the locks became free in time; or, at once, the caller may not open a lock file, a
 *                      shared lock would have to become exclusive, or the request does not name one valid way to take
 *                      them
 *   ERR_CREATE_FAILED, ERR_OPEN_FAILED  as ErrTLIBILockCheckDir */
TAVO_API int ErrTLIBFileLock(unsigned int request, int timeout);

/* Releases the locks of mask that this process holds, each once; the low four bits are ignored, so the request itself
 * can be passed. Locks that are not held are skipped.
 * Returns 0, or -1 with ERR_UNLOCK_FAILED when the kernel refused to unlock a file; the file is closed anyway. */
TAVO_API int ErrTLIBFileUnlock(unsigned int mask);

/* For a freshly forked child: closes every lock file and resets every count. The parent keeps its locks.
 * Returns 0, or -1 with ERR_UNLOCK_FAILED when a close failed; the others are closed anyway. */
TAVO_API int ErrTLIBFileCloseLock(void);

/* For a freshly forked child that takes over some of its parent's locks: those of mask are counted once, all others
 * are closed. The file of a lock that is taken over stays locked until both processes have closed it.
 * Returns 0, or -1 with ERR_UNLOCK_FAILED when a close failed; the others are closed anyway. */
TAVO_API int ErrTLIBFileResetLock(unsigned int mask);

/* Creates /tmp/lock and every lock file that is missing, and removes the permissions of group and others from the
 * existing ones. ErrTLIBFileLock does so itself.
 * Everybody may create names in /tmp. So the directory must belong to root or to the caller and be writable only by its
 * owner, and a lock file must be a regular file of one of the two; a symbolic link is never followed. For root,
 * anything at /tmp/lock that does not belong to root is renamed to "/tmp/lock.foreign-" and 16 random digits, which is
 * logged, and the directory is created in its place.
 * Returns 0, or -1 with
 *   ERR_CREATE_FAILED  /tmp/lock cannot be created, is not a directory, or fails these checks
 *   ERR_OPEN_FAILED    a lock file cannot be created, is not a regular file, or fails these checks
 *   ERR_OUT_OF_MEMORY */
TAVO_API int ErrTLIBILockCheckDir(void);

TAVO_END_DECLS

#endif
