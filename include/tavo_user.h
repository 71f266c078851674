/*
 * Local user accounts.
 *
 * The accounts live in the account cache database (tavo_bdb.h). After every change the library rewrites the four files
 * that the rest of the system reads, each by a temporary file and a rename:
 *   /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd
 * When another program has edited one of them, or the database is missing or damaged, the next call first rebuilds the
 * database from the files. docs/accounts.md describes the order of the steps.
 *
 * Account names are compared without regard to case; the case that was typed is kept. A name that holds a backslash
 * ("DOMAIN\user") is a domain account: it shares the record but is never written to the local files, and on an
 * appliance without a domain none is ever found.
 *
 * Adding, changing and deleting need root. They hold the password, group and Samba locks exclusively (tavo_lock.h) and
 * the system's own lock on the password files (lckpwdf), a password change the password lock and the system's own,
 * reading the password lock shared; each waits at most 5 seconds. Do not call them with lckpwdf held. After a change the
 * caches of nscd and sssd are flushed where these daemons run.
 *
 * Unless said otherwise a function returns 0 or a count, or -1 with the code set. Any of them may fail with
 *   ERR_OUT_OF_MEMORY     no memory
 *   ERR_LOCK_FAILED       a lock was not free within 5 seconds
 *   ERR_OPEN_FAILED       the account cache database cannot be opened or rebuilt
 *   ERR_READ_FAILED       a text file, or the record of an unfinished change, cannot be read
 *   ERR_NOT_ENOUGH_SPACE  the database cannot be rebuilt: /tmp is full
 *   ERR_RENAME_FAILED     an unfinished change cannot be completed: a file cannot be moved into place
 *   ERR_DB_CURSOR, ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED  the database cannot be read
 *   ERR_ACCESS_DENIED     a program without root may not read the text file that has the answer
 * and then nothing has changed.
 */
#ifndef TAVO_USER_H
#define TAVO_USER_H

#include "tavo_bdb.h"
#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* The accounts that TAVOUserEnum lists. */
enum {
    TAVO_USER_LOCAL = 0x1,      /* local accounts */
    TAVO_USER_DOMAIN = 0x2,     /* domain accounts */
    TAVO_USER_DOMAIN_USED = 0x4 /* also the domain accounts that are recorded as in use; they come first */
};

/* The kinds of accounts. */
enum {
    TAVO_USER_KIND_NONE = 0,  /* no name */
    TAVO_USER_KIND_LOCAL = 1, /* a local account */
    TAVO_USER_KIND_DOMAIN = 2 /* a domain account: its name holds a backslash */
};

/* Numbers that the families share. */
enum {
    TAVO_USER_UID_MIN = 1024,          /* the first user id that the library chooses */
    TAVO_USER_UID_MAX = 3072,          /* the last one */
    TAVO_USER_UID_GUEST = 1025,        /* listed only where guest access is supported */
    TAVO_USER_GID_DEFAULT = 100,       /* the primary group of an account that names none */
    TAVO_USER_PRIVILEGE_ADMIN = 0x3F,  /* the fixed privileges of "admin" */
    TAVO_USER_PRIVILEGE_DOMAIN = 0x23, /* the fixed privileges of a domain account */
    TAVO_USER_EXPIRE_LAST = 24855      /* the last day that a 32-bit time can hold */
};

/* One user. A single block: release it with TAVOUserFree only. No string is NULL in a record that the library filled.
 */
typedef struct TAVOUSER {
    char *szName;             /* as typed */
    char *szPasswd;           /* the hash of the shadow file; for TAVOUserSet, that hash (the password stays unchanged)
                                  or a new password in clear text */
    int32_t nUid;             /* -1 when passed in: choose one (add), keep it (change) */
    int32_t nGid;             /* primary group; -1 when passed in: 100 */
    char *szDesc;             /* free text */
    char *szHome;             /* "" when passed in: "/var/services/homes/" and the name */
    char *szShell;            /* "" when passed in: "/bin/csh" */
    int32_t nExpired;         /* last valid day in days since 1970-01-01 UTC; negative: never expires */
    int32_t fCannotChgPasswd; /* 1: the user may not change the password */
    char *szMail;             /* mail address */
    int32_t nKind;            /* one of TAVO_USER_KIND_ */
    int32_t nPrivilege;       /* application privilege bits; always 0x3F for "admin" */
    int32_t cbBlock;          /* bytes of the whole block */
} TAVOUSER;

/* The five stores of the user database, each open. Open them with TAVOBDbOpen under the password lock, after a reading
 * call of this family has brought them up to date; close them with TAVOBDbClose. */
typedef struct TAVOUSERDB {
    TAVOBDB *pName;
    TAVOBDB *pMisc;
    TAVOBDB *pShadow;
    TAVOBDB *pSmb;
    TAVOBDB *pUid;
} TAVOUSERDB;

/*
 * Records.
 */

/* Fills a record. *ppUser is NULL, or a record to be refilled, which may move; arguments may point into it. Texts are
 * copied; NULL means "". The kind follows from the name. Release the record with TAVOUserFree.
 * Fails, the record untouched, with ERR_BAD_PARAMETERS (ppUser NULL, szName NULL or empty). */
TAVO_API int TAVOUserAlloc(TAVOUSER **ppUser, const char *szName, const char *szPasswd, int uid, int gid,
                           const char *szDesc, const char *szHome, const char *szShell, int expired,
                           int fCannotChgPasswd, const char *szMail, int privilege);

/* Releases a record; NULL is allowed. */
TAVO_API void TAVOUserFree(TAVOUSER *pUser);

/*
 * Reading.
 */

/* Reads one account by name (any case) or by user id into *ppUser: NULL, or a record to be refilled. The caller
 * releases it with TAVOUserFree.
 * Fails, *ppUser untouched, with
 *   ERR_BAD_PARAMETERS    ppUser is NULL, or the name NULL or empty
 *   ERR_NO_SUCH_USER      there is no such account
 *   ERR_INVALID_USERNAME  the name cannot be converted, or the stored line has an empty one
 *   ERR_FORMAT_ERROR      a stored line has the wrong number of fields
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where
 *   they are not current)
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserGet(const char *szName, TAVOUSER **ppUser);
TAVO_API int TAVOUserGetByUID(int uid, TAVOUSER **ppUser);

/* Appends the names of the accounts that `flags` (TAVO_USER_) select, in the order of their upper-case names, and
 * returns their number. System accounts (user ids below 1024) are not listed; the guest account (1025) only where guest
 * access is supported. The list may move: *ppList is updated, also when the call fails half-way.
 * ByPrefix and BySubstr list only names that begin with, or hold, szText, without regard to case; "" selects all.
 * Fails with
 *   ERR_BAD_PARAMETERS  ppList, *ppList or szText is NULL, or no flag is set
 *   ERR_ENUM_FAILED     the database cannot be walked
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where
 *   they are not current)
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserEnum(TLIBSZLIST **ppList, int flags);
TAVO_API int TAVOUserEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText);
TAVO_API int TAVOUserEnumBySubstr(TLIBSZLIST **ppList, int flags, const char *szText);

/* The number of names that TAVOUserEnum would append. Fails as it does.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where
 *   they are not current)
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserTotalNum(int flags);

/* Returns the number of accounts that may still be created: "maxaccounts" of /etc.defaults/tavoinfo.conf minus the
 * existing accounts; 0 when the key is present but empty. The number is negative when there are too many accounts.
 * Returns -1 with a code when the file or the key cannot be read; -1 without a new code means one account too many.
 * Files: /etc.defaults/tavoinfo.conf, /tmp/.db.user.*
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOConfGetUserLimit(void);

/* Returns the application privilege bits of an account: 0x3F for "admin", 0 for "guest", 0x23 for a domain account; the
 * stored bits for any other account. Fails as TAVOUserGet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where
 *   they are not current)
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserPrivilegeGet(const char *szName);

/* Filters the names of an array that ends with NULL: copies those of existing accounts to szBuf, joined by ",", in the
 * caller's order and spelling. Returns the length with its NUL; szBuf NULL with cbBuf 0 asks for the length only.
 * Fails with
 *   ERR_BAD_PARAMETERS     rgszName is NULL, cbBuf negative, or szBuf NULL with a cbBuf other than 0
 *   ERR_NOT_ENOUGH_MEMORY  the buffer is too small; it is untouched
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where
 *   they are not current)
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserGetValidUserList(const char *const *rgszName, char *szBuf, int cbBuf);

/*
 * Changing.
 */

/* Adds, changes and renames users in one batch of nUser. rgszOldName[i] NULL adds rgpUser[i]; otherwise the account of
 * that name is changed to rgpUser[i], which may have a new name.
 *   added:    user id -1 is chosen, group id -1 becomes 100, the password is hashed, the home folder is created where
 *             "userHomeEnable" is "yes" in /etc/tavoinfo.conf.
 *   changed:  user id -1 is kept, group id -1 becomes 100, the home becomes "/var/services/homes/" and the name. A
 *             password that equals the stored hash is kept, with its Samba hashes. A user that is renamed keeps group
 *             memberships, Samba's lists, the FTP list and the home folder.
 * An entry that fails is logged (LOG_NOTICE) with its code and skipped; the others are applied. Its code is one of
 *   ERR_INVALID_USERNAME  the name is not acceptable, or is "." or ".."
 *   ERR_USER_EXISTS       the (new) name exists, in any case
 *   ERR_NO_SUCH_USER      the old name does not exist
 *   ERR_TOO_MANY_USERS    all user ids are taken
 *   ERR_FORMAT_ERROR      a stored line has the wrong number of fields
 *   ERR_BAD_PARAMETERS    a text holds what its file cannot: a newline, a carriage return, a colon (home, shell, mail)
 *   ERR_READ_FAILED       the settings that say how passwords are hashed cannot be read
 *   ERR_REMOVE_FAILED     rights of an earlier account of this name could not be removed yet; a later call tries again
 * Returns 0 when the batch was completed, even if entries failed: read the accounts back, or check the error code,
 * which is that of the last failed entry. Returns -1, with no account changed, with
 *   ERR_BAD_PARAMETERS    an array is NULL, or nUser negative
 *   ERR_ACCESS_DENIED     the program is not root
 *   ERR_OUT_OF_MEMORY     no memory
 *   ERR_WRITE_FAILED, ERR_NOT_ENOUGH_SPACE  the files cannot be written, or would lose an account that they have
 *   ERR_RENAME_FAILED     a file cannot be moved into place; if others were moved before it, the next call moves the
 *                         rest
 *   ERR_DB_STORE, ERR_DB_DELETE  the database cannot be changed
 * and with ERR_UNLOCK_FAILED when the change was made but the locks could not be released.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*, /etc/group,
 *   /usr/tavo/etc/smb.conf, /usr/tavo/etc/share.conf, /usr/tavo/etc/afpd.conf, /etc/ftpchroot,
 *   /etc/.tavoaccount.commit
 * Runs: /bin/mv, /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s), TAVO_LOCK_GROUP (exclusive), TAVO_LOCK_SMB (exclusive) */
TAVO_API int TAVOUserSet(const char *const *rgszOldName, const TAVOUSER *const *rgpUser, int nUser);

/* TAVOUserSet for one user; a NULL record is ERR_BAD_PARAMETERS and -1. Like a batch it returns 0 when the entry itself
 * was refused: clear the error code before the call and check it afterwards.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*, /etc/group,
 *   /usr/tavo/etc/smb.conf, /usr/tavo/etc/share.conf, /usr/tavo/etc/afpd.conf, /etc/ftpchroot,
 *   /etc/.tavoaccount.commit
 * Runs: /bin/mv, /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s), TAVO_LOCK_GROUP (exclusive), TAVO_LOCK_SMB (exclusive) */
TAVO_API int TAVOUserSetOne(const char *szOldName, const TAVOUSER *pUser);

/* Stores hashes that were computed elsewhere: rgszHash for the shadow file, rgszLmHash and rgszNtHash (32 hexadecimal
 * digits each) for Samba. Only the name of a record is used. An entry with a NULL record, name or hash is skipped; an
 * entry that fails is logged and skipped. Everything else about the account stays unchanged.
 * Returns 0, or -1 with ERR_BAD_PARAMETERS (an array is NULL, nUser is negative) or as TAVOUserSet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*,
 *   /etc/.tavoaccount.commit
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s) */
TAVO_API int TAVOUserSetPasswd(const TAVOUSER *const *rgpUser, const char *const *rgszHash,
                               const char *const *rgszLmHash, const char *const *rgszNtHash, int nUser);

/* Locks the password of an account (fLocked not 0) or unlocks it. Locked, the hash in the shadow file has a "!" in
 * front, which no password fits, and Samba's line has the flag "D" of a disabled account; unlocked, both are as before.
 * Sessions that are open, keys of SSH and the credentials of the network backup service are not touched. A new password
 * unlocks the account; every other change by TAVOUserSet leaves it locked. Locking a locked account and unlocking an
 * unlocked one succeed.
 * Returns 0, or -1 with nothing changed and
 *   ERR_BAD_PARAMETERS    szName is NULL; or there is nothing to unlock: the account has no hash, or "*"
 *   ERR_INVALID_USERNAME  the name cannot be converted
 *   ERR_NO_SUCH_USER      there is no such local account, or it has no line in the shadow file
 *   ERR_FORMAT_ERROR      a stored line has the wrong number of fields
 * or as TAVOUserSet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*,
 *   /etc/.tavoaccount.commit
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s) */
TAVO_API int TAVOUserLockSet(const char *szName, int fLocked);

/* Sets how long a password is valid, in days, 0 to 99999; -1 leaves a number unchanged. nMin: days that must pass
 * before the user may change it again; nMax: days after which it must be changed; nWarn: days of warning before that.
 * TAVOUserSet, when it changes or renames the account, writes 0, 99999 and 7 again (100000 for nMin where
 * fCannotChgPasswd is set), TAVOUserSetPasswd 7 for nWarn.
 * Returns 0, or -1 with nothing changed and
 *   ERR_BAD_PARAMETERS  szName is NULL; a number is out of range; nMax would not be above nMin; or nMin or nMax is
 *                       given for an account that may not change its password, which is stored as an nMin above nMax
 * or as TAVOUserLockSet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*,
 *   /etc/.tavoaccount.commit
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s) */
TAVO_API int TAVOUserAgingSet(const char *szName, int nMin, int nMax, int nWarn);

/* Deletes the named users in one batch of nUser: their quotas, SMB connections, Samba and group entries and home
 * folders too. "root" and "admin" (any case) and NULL are refused with ERR_USER_DB_DELETE, that entry only; domain
 * names and names that do not exist are skipped. Returns 0, or -1 as TAVOUserSet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*, /etc/group,
 *   /usr/tavo/etc/smb.conf, /usr/tavo/etc/share.conf, /usr/tavo/etc/afpd.conf, /etc/ftpchroot,
 *   /etc/.tavoaccount.commit
 * Runs: /usr/bin/smbstatus, /usr/bin/smbcontrol, /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s), TAVO_LOCK_GROUP (exclusive), TAVO_LOCK_SMB (exclusive) */
TAVO_API int TAVOUserDelete(const char *const *rgszName, int nUser);

/*
 * Expiry.
 */

/* Returns 1 when the day (days since 1970-01-01 UTC) has passed, else 0; a negative day never passes. An account is
 * valid through the whole local day. The time zone is the first line of /etc/TZ, which is copied to the TZ variable of
 * the process and stays there.
 * Files: /etc/TZ */
TAVO_API int TAVOUserIsExpired(int day);

/* Returns 1 when the account's last valid day has passed, else 0, or -1 as TAVOUserGet.
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*, /etc/TZ
 * Locks: TAVO_LOCK_USER (shared, at most 5 s) */
TAVO_API int TAVOUserCheckExpired(const char *szName);

/* Sets the record's expiry from "yyyy/mm/dd"; a date before 1970 becomes day 24855. Fails, the record untouched, with
 * ERR_BAD_PARAMETERS (a NULL argument, no valid date). */
TAVO_API int TAVOUserExpiredDateFill(TAVOUSER *pUser, const char *szDate);

/* Writes the record's expiry into szBuf as year/month/day without leading zeros; "" for a day below 2. Fails with
 * ERR_BAD_PARAMETERS (a NULL argument, cbBuf below 1) and ERR_NOT_ENOUGH_MEMORY (the buffer is too small). */
TAVO_API int TAVOUserExpiredDateGet(const TAVOUSER *pUser, char *szBuf, int cbBuf);

/*
 * Names and passwords.
 */

/* Returns 1 when the name is acceptable: 1 to 64 UTF-8 characters; ASCII letters, digits, ".", "-", "_", blanks and any
 * non-ASCII character; no "-" or blank first, no blank last. Else 0; sets no code. */
TAVO_API int BlTLIBIsUserName(const char *szName);

/* Computes the LAN Manager hash of the password: in code page 850, upper-case, its first 14 bytes. rgHash holds 16
 * bytes.
 * Returns 0, or -1 with rgHash untouched and ERR_BAD_PARAMETERS for a NULL argument, ERR_OP_FAILURE when the password
 * cannot be converted or the library's extras cannot be loaded, or ERR_OUT_OF_MEMORY. */
TAVO_API int TLIBSmbLmHash(const char *szPasswd, unsigned char *rgHash);

/* Computes the NT hash: MD4 of the password in UTF-16, low byte first. Returns as TLIBSmbLmHash. */
TAVO_API int TLIBSmbMd4Hash(const char *szPasswd, unsigned char *rgHash);

/* Returns the salt character for a number: its absolute value modulo 64 in "0-9A-Za-z./". */
TAVO_API char TAVOUserRandomNumMap2Seed(int n);

/*
 * The database underneath. These take no lock: hold the password lock.
 */

/* Returns the next free user id after the one assigned last ("#CURRENT_UID"), from 1024 to 3072 and then from the
 * beginning. Fails with ERR_BAD_PARAMETERS (no uid store), ERR_DB_CURSOR (it cannot be read), ERR_TOO_MANY_USERS.
 * Files: /tmp/.db.user.* */
TAVO_API int TAVOUserDBGetFreeUid(TAVOUSERDB *pDb);

/* Writes one account into the open stores: a new one when szOldName is NULL, else in place of that one. pUser must have
 * a user id and a group id. Fails with the codes of TAVOUserSet's entries, and then nothing is stored. Returns 0 for a
 * domain account without storing it. The files are not written: TAVOUserDBDump does that.
 * Files: /tmp/.db.user.* */
TAVO_API int TAVOUserDBSet(TAVOUSERDB *pDb, const char *szOldName, const TAVOUSER *pUser);

/* Rewrites the four files from the open stores and records their modification times there. A file keeps its owner,
 * group and mode. If /etc/passwd has an account that the stores lack and that was not deleted through these handles,
 * nothing is written.
 * Fails with
 *   ERR_OPEN_FAILED       a temporary file cannot be created
 *   ERR_WRITE_FAILED      one cannot be written, or an account would be lost
 *   ERR_NOT_ENOUGH_SPACE  the disk is full
 *   ERR_RENAME_FAILED     a file cannot be moved into place
 * Files: /etc/passwd, /etc/shadow, /etc/tavouser.conf, /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.*,
 *   /etc/.tavoaccount.commit
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache */
TAVO_API int TAVOUserDBDump(TAVOUSERDB *pDb);

/* Removes the temporary files beside the four. Returns 0, or -1 with ERR_REMOVE_FAILED.
 * Files: /etc/passwd.tmp, /etc/shadow.tmp, /etc/tavouser.conf.tmp, /usr/tavo/etc/private/smbpasswd.tmp */
TAVO_API int TAVOUserRemoveTmpFiles(void);

TAVO_END_DECLS

#endif
