/*
 * Account cache database: the key/value files in which the user and group families keep their accounts.
 *
 * A store is one btree file of Berkeley DB. The user family has five, the group family three, all in /tmp. They are
 * built from the account files under /etc and can be rebuilt from them at any time (docs/accounts.md). Keys and values
 * are byte strings with a length. Keys that begin with "#" are reserved for bookkeeping; their four-byte values are
 * 32-bit integers in host order.
 *
 * Nothing here takes a lock: hold the password lock (users) or the group lock (groups) of tavo_lock.h around every use
 * of the account stores. A handle belongs to one thread.
 *
 * Every failure of the database itself is logged with the system's errno.
 */
#ifndef TAVO_BDB_H
#define TAVO_BDB_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/* The files of the user store: passwd line, misc line, shadow line and Samba line by upper-case name, and upper-case
 * name by user id ("%06d"). Names, ids and values are stored with their terminating NUL. */
#define TAVO_USER_DB_NAME   "/tmp/.db.user.name.1379"
#define TAVO_USER_DB_MISC   "/tmp/.db.user.misc.1379"
#define TAVO_USER_DB_SHADOW "/tmp/.db.user.shadow.1379"
#define TAVO_USER_DB_SMB    "/tmp/.db.user.smb.1379"
#define TAVO_USER_DB_UID    "/tmp/.db.user.uid.1379"

/* The files of the group store: group line by upper-case name, upper-case name by group id ("%06d"), and description
 * line by upper-case name. */
#define TAVO_GROUP_DB_NAME "/tmp/.db.group.name.1379"
#define TAVO_GROUP_DB_ID   "/tmp/.db.group.id.1379"
#define TAVO_GROUP_DB_DESC "/tmp/.db.group.desc.1379"

/* The reserved keys and the number of bytes stored of each: some include the NUL, some do not. */
#define TAVO_BDB_KEY_SYNC_TIME      "#TAVO@SYNC@TIME"
#define TAVO_BDB_KEY_SYNC_TIME_LEN  15
#define TAVO_BDB_KEY_DEPRECATED     "#TAVO@DEPRECATED"
#define TAVO_BDB_KEY_DEPRECATED_LEN 17
#define TAVO_BDB_KEY_EXPIRE         "#TAVO@EXPIRE@TIME"
#define TAVO_BDB_KEY_EXPIRE_LEN     17
#define TAVO_BDB_KEY_UID            "#CURRENT_UID"
#define TAVO_BDB_KEY_UID_LEN        12
#define TAVO_BDB_KEY_GID            "#CURRENT_GID"
#define TAVO_BDB_KEY_GID_LEN        12

/* Where the next TAVOBDbCursorGet goes. */
enum {
    TAVO_BDB_CURSOR_KEY = 1,   /* the first key that is not less than the given one: compare what comes back */
    TAVO_BDB_CURSOR_FIRST = 2, /* the first key */
    TAVO_BDB_CURSOR_LAST = 3,  /* the last key */
    TAVO_BDB_CURSOR_NEXT = 4,  /* the next key; the first one when nothing was read yet. A new handle starts here */
    TAVO_BDB_CURSOR_PREV = 5   /* the key before */
};

/* An open store. Only TAVOBDbOpen makes one; TAVOBDbClose releases it. */
typedef struct TAVOBDB {
    void *pDb;           /* the database's own handle */
    int32_t nCursorType; /* one of TAVO_BDB_CURSOR_ */
} TAVOBDB;

/* Opens the store szPath. `flags` are those of open(2): O_RDONLY, O_RDWR, and O_CREAT to create a missing file.
 * fBtreeInfo 1 passes the database a zeroed parameter block, 0 passes none; the resulting files are the same.
 * New files, and for root every file that is opened, get mode 0666. A symbolic link is not followed.
 * The stores of the account families (TAVO_USER_DB_..., TAVO_GROUP_DB_...) belong to root: mode 0644, those of password
 * hashes 0600. A file there that is not root's, has a second name or grants more than that mode is not a store. Only
 * root creates or clears them; another program may open for reading what its rights let it read.
 * Returns a handle for TAVOBDbClose, or NULL with
 *   ERR_BAD_PARAMETERS    szPath is NULL or empty
 *   ERR_OUT_OF_MEMORY     no memory
 *   ERR_ACCESS_DENIED     no permission
 *   ERR_FILE_NOT_FOUND    no such file, and O_CREAT was not given
 *   ERR_DB_OPEN           the file is not a store: it has been removed; the next open with O_CREAT creates one.
 *                         A folder with something in it is renamed to "NAME.aside.XXXXXX" instead
 *   ERR_NOT_ENOUGH_SPACE  the disk is full
 *   ERR_OPEN_FAILED       anything else */
TAVO_API TAVOBDB *TAVOBDbOpen(const char *szPath, int flags, int fBtreeInfo);

/* Writes what is still in memory and releases the handle, also when it fails.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS  pDb is NULL
 *   ERR_DB_CLOSE        not everything could be written: the store may be damaged */
TAVO_API int TAVOBDbClose(TAVOBDB *pDb);

/* Reads the value of a key of cbKey bytes. *ppValue becomes a copy of *pcbValue bytes, followed by a NUL that is
 * not counted; the caller releases it with TAVOBDbFree.
 * Returns 0, or -1 with the outputs untouched and
 *   ERR_BAD_PARAMETERS  an argument is NULL, or cbKey is below 1
 *   ERR_OUT_OF_MEMORY   no memory
 *   ERR_KEY_NOT_FOUND   there is no such key
 *   ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED, ERR_DB_CURSOR  input/output error, interrupted, anything else */
TAVO_API int TAVOBDbGet(TAVOBDB *pDb, const void *pKey, int cbKey, void **ppValue, int *pcbValue);

/* Stores a value, replacing the one that the key has. It reaches the file when the handle is closed, or earlier.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS    an argument is NULL, cbKey is below 1 or cbValue negative
 *   ERR_NOT_ENOUGH_SPACE  the disk is full
 *   ERR_OUT_OF_MEMORY     no memory: the store may be damaged
 *   ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED, ERR_DB_STORE  input/output error, interrupted, anything else */
TAVO_API int TAVOBDbSet(TAVOBDB *pDb, const void *pKey, int cbKey, const void *pValue, int cbValue);

/* Deletes a key.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS    an argument is NULL, or cbKey is below 1
 *   ERR_KEY_NOT_FOUND     there is no such key
 *   ERR_NOT_ENOUGH_SPACE  the disk is full
 *   ERR_OUT_OF_MEMORY     no memory: the store may be damaged
 *   ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED, ERR_DB_DELETE  input/output error, interrupted, anything else */
TAVO_API int TAVOBDbDelete(TAVOBDB *pDb, const void *pKey, int cbKey);

/* Sets where the next TAVOBDbCursorGet goes. Returns 0, or -1 with ERR_BAD_PARAMETERS for a NULL handle or a
 * type that is not one of TAVO_BDB_CURSOR_. */
TAVO_API int TAVOBDbCursorSetType(TAVOBDB *pDb, int type);

/* Moves the cursor as its type says and reads the entry there. With TAVO_BDB_CURSOR_KEY, *ppKey and *pcbKey hold the
 * key to look for. On success *ppKey and *ppValue are new copies, which the caller releases with TAVOBDbFree, and
 * *pcbKey and *pcbValue are their lengths. The caller keeps the key that it passed in.
 * With fSkipReserved 1, keys that begin with "#" are skipped, except with TAVO_BDB_CURSOR_KEY; the first skip turns the
 * handle's type FIRST into NEXT and LAST into PREV.
 * To list a store: type FIRST for the first entry, NEXT for the rest. Do not store or delete while walking.
 * Returns 0, or -1 with the outputs untouched and
 *   ERR_BAD_PARAMETERS  an argument is NULL, or the key to look for is missing or empty
 *   ERR_OUT_OF_MEMORY   no memory
 *   ERR_DB_END          there is no further entry
 *   ERR_DISK_IO_FAILED, ERR_DB_INTERRUPTED, ERR_DB_CURSOR  input/output error, interrupted, anything else */
TAVO_API int TAVOBDbCursorGet(TAVOBDB *pDb, int fSkipReserved, void **ppKey, int *pcbKey, void **ppValue,
                              int *pcbValue);

/* Releases a key or value that TAVOBDbGet or TAVOBDbCursorGet returned; NULL is allowed. */
TAVO_API void TAVOBDbFree(void *pValue);

/*
 * The bookkeeping keys. The setters fail as TAVOBDbSet, the getters as TAVOBDbGet, and both with ERR_BAD_PARAMETERS for
 * a NULL argument. The getters fail with ERR_DB_CURSOR when the value is not four bytes long. They return 0 or -1
 * unless said otherwise.
 */

/* The modification time, in seconds, of the text file that the store was last written to or built from. Kept as 32
 * bits; the high bits of a later time are dropped. */
TAVO_API int TAVOBDbConfSyncTimeSet(TAVOBDB *pDb, int64_t time);
TAVO_API int TAVOBDbConfSyncTimeGet(TAVOBDB *pDb, int32_t *pTime);

/* Compares the recorded time with mtime, the modification time of the text file, in seconds.
 * Returns 0 when the store is current, 1 when the file has been changed since, -1 when no time can be read. */
TAVO_API int TAVOBDbIsNeedToRebuild(TAVOBDB *pDb, int64_t mtime);

/* A mark that every new store of the account families carries with the value 0. */
TAVO_API int TAVOBDbDeprecatedSet(TAVOBDB *pDb, int32_t value);
TAVO_API int TAVOBDbDeprecatedGet(TAVOBDB *pDb, int32_t *pValue);

/* The time, in seconds, at which the domain part of a store was last refreshed. Set records the current time; Delete
 * removes the record and fails as TAVOBDbDelete. */
TAVO_API int TAVOBDbDomainExpireTimeSet(TAVOBDB *pDb);
TAVO_API int TAVOBDbDomainExpireTimeGet(TAVOBDB *pDb, int32_t *pTime);
TAVO_API int TAVOBDbDomainExpireTimeDelete(TAVOBDB *pDb);

/* Returns 1 when the domain part was never refreshed, was refreshed more than 300 seconds ago, or has a time in the
 * future; else 0. */
TAVO_API int TAVOBDbIsNeedToDomainRebuild(TAVOBDB *pDb);

TAVO_END_DECLS

#endif
