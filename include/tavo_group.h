/*
 * Local groups.
 *
 * The groups live in the account cache database (tavo_bdb.h). After every change the library rewrites the two files
 * that the rest of the system reads, each by a temporary file and a rename:
 *   /etc/group, /etc/group_desc
 * When another program has edited one of them, or the database is missing or damaged, the next call first rebuilds the
 * database from the files. docs/accounts.md describes the order of the steps.
 *
 * Group names are compared without regard to case; the case that was typed is kept. A name that holds a backslash
 * ("DOMAIN\group") is a domain group: it shares the record but is never written to the local files, and on an appliance
 * without a domain none is ever found. Everybody is a member of "users", so its members are never stored.
 *
 * Changing needs root. TAVOGroupSet holds the password, group and Samba locks exclusively (tavo_lock.h),
 * TAVOGroupDelete the group and Samba locks, TAVOGroupDescSet and TAVOUserModifyGroup the group lock, each also the
 * system's own lock on the account files (lckpwdf); reading holds the group lock shared. Each waits at most 5 seconds.
 * A program that takes these locks itself takes the password lock before the group lock, and the group lock before the
 * Samba lock.
 *
 * Unless said otherwise a function returns 0 or a count, or -1 with the code set. Any of them may fail with
 *   ERR_OUT_OF_MEMORY     no memory
 *   ERR_LOCK_FAILED       a lock was not free within 5 seconds
 *   ERR_OPEN_FAILED       the account cache database cannot be opened or rebuilt
 *   ERR_READ_FAILED       a text file, or the record of an unfinished change, cannot be read
 *   ERR_NOT_ENOUGH_SPACE  the database cannot be rebuilt: /tmp is full
 *   ERR_RENAME_FAILED     an unfinished change cannot be completed: a file cannot be moved into place
 *   ERR_DB_CURSOR, ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED  the database cannot be read
 *   ERR_ACCESS_DENIED     a program without root may not read /etc/group or /etc/group_desc
 * and then nothing has changed.
 */
#ifndef TAVO_GROUP_H
#define TAVO_GROUP_H

#include "tavo_bdb.h"
#include "tavo_error.h"
#include "tavo_hash.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* The groups that TAVOGroupEnum lists. */
enum {
    TAVO_GROUP_LOCAL = 0x1, /* local groups */
    TAVO_GROUP_DOMAIN = 0x2 /* domain groups */
};

/* The kinds of groups. */
enum {
    TAVO_GROUP_KIND_NONE = 0,  /* no name */
    TAVO_GROUP_KIND_LOCAL = 1, /* a local group */
    TAVO_GROUP_KIND_DOMAIN = 2 /* a domain group: its name holds a backslash */
};

/* The group ids that the library chooses. */
enum { TAVO_GROUP_GID_MIN = 65536, TAVO_GROUP_GID_MAX = 95536 };

/* One group. A single block: release it with TAVOGroupFree only. */
typedef struct TAVOGROUP {
    char *szName;      /* as typed */
    int32_t nGid;      /* -1 when passed in: choose one (add), keep it (change) */
    char **rgszMember; /* names of users, NULL at the end; when passed in NULL means none */
    int32_t nKind;     /* one of TAVO_GROUP_KIND_ */
    int32_t cbBlock;   /* bytes of the whole block */
} TAVOGROUP;

/* The three stores of the group database, each open. Open them with TAVOBDbOpen under the group lock, after a reading
 * call of this family has brought them up to date; close them with TAVOBDbClose. */
typedef struct TAVOGROUPDB {
    TAVOBDB *pName;
    TAVOBDB *pGid;
    TAVOBDB *pDesc;
} TAVOGROUPDB;

/*
 * Records.
 */

/* Fills a record from a line of /etc/group, which must have four fields. *ppGroup is NULL, or a record to be refilled,
 * which may move. Release the record with TAVOGroupFree.
 * Fails, the record untouched, with
 *   ERR_BAD_PARAMETERS     an argument is NULL
 *   ERR_FORMAT_ERROR       the line does not have four fields, or the third is not a number
 *   ERR_INVALID_GROUPNAME  the name is empty */
TAVO_API int TAVOGroupAlloc(TAVOGROUP **ppGroup, const char *szLine);

/* Fills a record from a name, a group id and an array of member names with NULL at its end (NULL: none). Members called
 * "nobody" and empty ones are left out. As TAVOGroupAlloc; arguments may point into the old record. Fails with
 * ERR_BAD_PARAMETERS (ppGroup NULL, szName NULL or empty). */
TAVO_API int TAVOGroupAlloc2(TAVOGROUP **ppGroup, const char *szName, int gid, const char *const *rgszMember);

/* Releases a record; NULL is allowed. */
TAVO_API void TAVOGroupFree(TAVOGROUP *pGroup);

/*
 * Reading.
 */

/* Returns 1 when a new group may have this name, else 0: 1 to 15 characters, ASCII letters, digits, ".", "-", "_",
 * blanks and everything beyond ASCII; neither "-" nor a blank at the beginning, no blank at the end. Sets no
 * code. */
TAVO_API int BlTLIBIsGroupName(const char *szName);

/* Reads one group by name (any case) or by group id into *ppGroup: NULL, or a record to be refilled. The caller
 * releases it with TAVOGroupFree.
 * Fails, *ppGroup untouched, with
 *   ERR_BAD_PARAMETERS     ppGroup is NULL, or the name NULL or empty
 *   ERR_NO_SUCH_GROUP      there is no such group
 *   ERR_INVALID_GROUPNAME  the name cannot be converted, or the stored line has an empty one
 *   ERR_FORMAT_ERROR       the stored line has the wrong number of fields
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.* (rebuilt where they are not current)
 * Locks: TAVO_LOCK_GROUP (shared, at most 5 s) */
TAVO_API int TAVOGroupGet(const char *szName, TAVOGROUP **ppGroup);
TAVO_API int TAVOGroupGetByGID(int gid, TAVOGROUP **ppGroup);

/* Appends the names of the groups that `flags` (TAVO_GROUP_) select, in the order of their upper-case names, and
 * returns their number. Local groups with ids below 65536 belong to the system and are not listed, except "users". The
 * list may move: *ppList is updated, also when the call fails half-way.
 * ByPrefix and BySubstr list only names that begin with, or hold, szText, without regard to case; "" selects all.
 * Fails with
 *   ERR_BAD_PARAMETERS  ppList, *ppList or szText is NULL, or no flag is set
 *   ERR_ENUM_FAILED     the database cannot be walked
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.* (rebuilt where they are not current)
 * Locks: TAVO_LOCK_GROUP (shared, at most 5 s) */
TAVO_API int TAVOGroupEnum(TLIBSZLIST **ppList, int flags);
TAVO_API int TAVOGroupEnumByPrefix(TLIBSZLIST **ppList, int flags, const char *szText);
TAVO_API int TAVOGroupEnumBySubstr(TLIBSZLIST **ppList, int flags, const char *szText);

/* The number of names that TAVOGroupEnum would append. Fails as TAVOGroupEnum.
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.* (rebuilt where they are not current)
 * Locks: TAVO_LOCK_GROUP (shared, at most 5 s) */
TAVO_API int TAVOGroupTotalNum(int flags);

/* Appends the members of a group that are existing users, in their stored order, and returns their number; for "users"
 * (any case) every local user that TAVOUserEnum lists. The list may move: *ppList is updated. Fails as TAVOGroupGet,
 * TAVOUserGetValidUserList and TAVOUserEnum; ppList or *ppList NULL is ERR_BAD_PARAMETERS.
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.*, /etc/passwd, /etc/shadow, /etc/tavouser.conf,
 *   /usr/tavo/etc/private/smbpasswd, /tmp/.db.user.* (rebuilt where they are not current)
 * Locks: TAVO_LOCK_GROUP (shared, at most 5 s), TAVO_LOCK_USER (shared, at most 5 s; after it, not with it) */
TAVO_API int TAVOGroupListMember(const char *szName, TLIBSZLIST **ppList);

/* Copies the description of a group into szBuf of cbBuf bytes: "" when it has none. Returns its length with the NUL;
 * szBuf NULL with cbBuf 0 asks for that.
 * Fails with
 *   ERR_BAD_PARAMETERS     the name is NULL or empty, cbBuf negative, or szBuf NULL with a cbBuf other than 0
 *   ERR_NO_SUCH_GROUP      there is no such group
 *   ERR_INVALID_GROUPNAME  the name cannot be converted
 *   ERR_FORMAT_ERROR       the stored line has the wrong number of fields
 *   ERR_NOT_ENOUGH_MEMORY  the buffer is too small; it is untouched
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.* (rebuilt where they are not current)
 * Locks: TAVO_LOCK_GROUP (shared, at most 5 s) */
TAVO_API int TAVOGroupDescGet(const char *szName, char *szBuf, int cbBuf);

/*
 * Changing.
 *
 * Beside the codes that each names, and those above, these functions may fail with
 *   ERR_ACCESS_DENIED     the program is not root
 *   ERR_OPEN_FAILED       a new file cannot be created
 *   ERR_WRITE_FAILED      one cannot be written, or would lose a group that /etc/group has
 *   ERR_NOT_ENOUGH_SPACE  the disk is full
 *   ERR_FORMAT_ERROR      a stored line has the wrong number of fields
 *   ERR_DB_STORE, ERR_DB_DELETE, ERR_GROUP_DB_DELETE  the database cannot be changed; the next call rebuilds it
 *   ERR_RENAME_FAILED     a file cannot be moved into place; when others were before it, the next call finishes that
 * and then the files are the old ones (but see ERR_RENAME_FAILED). ERR_UNLOCK_FAILED means that all was done but the
 * locks could not be released. Lists of shared folders and of Samba that cannot be changed do not make a call fail: that is
 * logged, and each later change of users or groups tries again.
 */

/* Adds a group (szOldName NULL) or changes the one called szOldName, also its name. The description of a renamed group
 * goes with it, and so do its places in the privilege lists of the shared folders and in Samba's settings.
 * Fails, nothing changed, in this order with
 *   ERR_BAD_PARAMETERS     pGroup or its name is NULL
 *   ERR_TOO_MANY_GROUPS    no group id is free (add, id -1)
 *   ERR_NO_SUCH_GROUP      there is no group szOldName
 *   ERR_GROUP_EXISTS       there is a group of the new name
 *   ERR_INVALID_GROUPNAME  the new name is not acceptable, is "." or "..", or belongs to a domain
 *   ERR_BAD_PARAMETERS     an id below -1; a member with a comma, a colon or a control character, or of more than 512
 *                          bytes
 *   ERR_REMOVE_FAILED      rights of an earlier group of this name could not be removed yet; a later call tries again
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.*, /usr/tavo/etc/smb.conf, /usr/tavo/etc/share.conf,
 *   /usr/tavo/etc/afpd.conf, /etc/ftpchroot, /etc/.tavoaccount.commit
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_USER (exclusive, at most 5 s), TAVO_LOCK_GROUP (exclusive), TAVO_LOCK_SMB (exclusive) */
TAVO_API int TAVOGroupSet(const char *szOldName, const TAVOGROUP *pGroup);

/* Deletes groups, "system" ones too: there is no protected name. Domain groups are skipped. A group that does not exist is
 * logged and skipped, and ERR_NO_SUCH_GROUP stays in the error state beside the result 0. The groups also leave the
 * privilege lists of the shared folders and Samba's settings. Returns 0 also when none was deleted.
 * Fails, no group deleted, with
 *   ERR_BAD_PARAMETERS   rgszName is NULL with nGroup not 0, or nGroup negative
 *   ERR_GROUP_DB_DELETE  a group cannot be taken from the database
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.*, /usr/tavo/etc/smb.conf, /usr/tavo/etc/share.conf
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_GROUP (exclusive, at most 5 s), TAVO_LOCK_SMB (exclusive) */
TAVO_API int TAVOGroupDelete(const char *const *rgszName, int nGroup);

/* Sets the description of a group; NULL or "" deletes it.
 * Fails, nothing changed, with
 *   ERR_BAD_PARAMETERS     the name is NULL or empty, or the description holds a colon or a control character or has
 *                          more than 512 bytes
 *   ERR_NO_SUCH_GROUP      there is no such group
 *   ERR_INVALID_GROUPNAME  the name cannot be converted
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.*
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_GROUP (exclusive, at most 5 s) */
TAVO_API int TAVOGroupDescSet(const char *szName, const char *szDesc);

/* Applies renames and deletions of users to the member lists of all groups: pshNames maps upper-case old names to new
 * names, "" for a deleted user. The files are rewritten once, and only when a list has changed.
 * Fails, nothing changed, with ERR_BAD_PARAMETERS (pshNames NULL) or as above.
 * Files: /etc/group, /etc/group_desc, /tmp/.db.group.*
 * Runs: /usr/sbin/nscd, /usr/sbin/sss_cache
 * Locks: TAVO_LOCK_GROUP (exclusive, at most 5 s) */
TAVO_API int TAVOUserModifyGroup(const TLIBSZHASH *pshNames);

/*
 * The open database, for programs that hold the group lock exclusively.
 */

/* Returns the next free group id after the one assigned last, from 65536 to 95536 and then from the beginning.
 * Fails with
 *   ERR_BAD_PARAMETERS   pDb or its store pGid is NULL
 *   ERR_TOO_MANY_GROUPS  all are taken
 *   ERR_DB_CURSOR, ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED  the store cannot be read
 * and ERR_OUT_OF_MEMORY. Nothing is stored. */
TAVO_API int TAVOGroupDBGetFreeGid(TAVOGROUPDB *pDb);

/* Stores one group, whose id must be given unless it keeps an old one; szOldName as in TAVOGroupSet. Neither the files nor
 * the record of the id assigned last are changed. Returns 0, or -1 with one of the codes that TAVOGroupSet names (ERR_BAD_PARAMETERS
 * also when pDb or one of its stores is NULL), and then nothing is stored. With a code of TAVOBDbSet, or with
 * ERR_GROUP_DB_DELETE when the old entries cannot be deleted, a part may be stored; the next call rebuilds the stores. */
TAVO_API int TAVOGroupDBSet(TAVOGROUPDB *pDb, const char *szOldName, const TAVOGROUP *pGroup);

TAVO_END_DECLS

#endif
