/*
 * String hash: a map from string keys to string values in one heap block.
 *
 * The block holds the header, an open-addressing table and copies of all keys and values, so one TLIBSzHashFree
 * releases everything. Keys are compared by bytes. A hash that has to grow moves: functions that can add text take the
 * address of the caller's pointer, replace it and free the old block. A returned string points into the block and is
 * valid until the next call that may grow, rebuild or free the hash; it may be passed to that call.
 *
 * The hash function adds up the words of a key. It is fast and stable, not strong: a sender who chooses the keys can
 * make them collide, so limit how many keys are taken from the network.
 *
 * A hash belongs to one thread at a time; nothing is locked. A code is recorded only for failures that name one.
 */
#ifndef TAVO_HASH_H
#define TAVO_HASH_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* Both pointers NULL: never used. Key not NULL: a pair. Key NULL and value not: a removed pair. */
typedef struct TLIBSZHASHSLOT {
    char *pszKey;
    char *pszValue;
} TLIBSZHASHSLOT;

#ifdef __clang__
#pragma clang diagnostic push
#pragma clang diagnostic ignored "-Wc99-extensions"
#endif

typedef struct TLIBSZHASH {
    int32_t nStrSize; /* bytes of the string area, which follows the slots */
    int32_t nStrFree; /* bytes of it that are free; a removed or replaced text keeps its bytes until the next rebuild */
    int32_t nSlot;    /* slots of the table */
    int32_t nPair;    /* keys present */
    char *pszNextStr; /* the next free byte of the string area; text is packed upward */
    __extension__ TLIBSZHASHSLOT slots[]; /* nSlot of them */
} TLIBSZHASH;

#ifdef __clang__
#pragma clang diagnostic pop
#endif

/* Creates an empty hash of 31 slots and cbStr bytes for text. The caller frees it with TLIBSzHashFree.
 * Returns NULL with the codes of PshTLIBIHashAllocator. */
TAVO_API TLIBSZHASH *PshTLIBSzHashAlloc(int cbStr);

/* The same with nSlot slots. NULL with
 *   ERR_BAD_PARAMETERS  a number is negative
 *   ERR_OUT_OF_MEMORY   no memory */
TAVO_API TLIBSZHASH *PshTLIBIHashAllocator(int nSlot, int cbStr);

/* Frees the hash with all its strings. NULL is ignored. */
TAVO_API void TLIBSzHashFree(TLIBSZHASH *pHash);

/* Returns the value of szKey, which points into the hash. NULL, without a code: the key is missing or an argument is
 * NULL. */
TAVO_API char *SzTLIBSzHashGetValue(const TLIBSZHASH *pHash, const char *szKey);

/* Sets the value of szKey to a copy of szValue, adding the key when it is missing.
 * Returns the pair's slot; -1, without a code and with the hash unchanged: an argument or *ppHash is NULL, or the hash
 * cannot grow. */
TAVO_API int TLIBSzHashSetValue(TLIBSZHASH **ppHash, const char *szKey, const char *szValue);

/* Removes szKey and returns its value, which is still in the hash's block. NULL, without a code: as
 * SzTLIBSzHashGetValue. */
TAVO_API char *SzTLIBSzHashRemoveKey(TLIBSZHASH *pHash, const char *szKey);

/* Removes every key; the table and the string area keep their sizes, the string area is free again. NULL is ignored. */
TAVO_API void PslSzHashRemoveAll(TLIBSZHASH *pHash);

/* Pushes every key onto the list *ppList, in slot order, when ppList is not NULL.
 * Returns the number of keys; -1 when pHash is NULL (no code) or a push fails (its code; the keys before it have been
 * pushed). */
TAVO_API int TLIBSzHashEnumKey(const TLIBSZHASH *pHash, TLIBSZLIST **ppList);

/* The number of keys. -1 with ERR_BAD_PARAMETERS: pHash is NULL. */
TAVO_API int TLIBSzHashPairNum(const TLIBSZHASH *pHash);

/* The number of keys. -1, without a code: pHash is NULL. */
TAVO_API int TLIBSzHashGetLength(const TLIBSZHASH *pHash);

/*
 * The steps that the functions above are made of. They record no code.
 */

/* The home slot of szKey in a table of nSlot slots: the sum of the key's four-byte words, read as little-endian,
 * modulo nSlot; 0 for an empty key. -1: szKey is NULL or nSlot is not positive. */
TAVO_API int TLIBIRadixHashCode(const char *szKey, int nSlot);

/* Returns the slot that holds szKey; -1: no slot does, or an argument is NULL. */
TAVO_API int TLIBIGetLookDict(const TLIBSZHASH *pHash, const char *szKey);

/* Returns the slot that holds szKey, else its home slot when that was never used, else the first slot of a removed pair
 * after its home slot. -1: none of these before the first slot that was never used, or an argument is NULL. The never
 * used slot itself is not returned; TLIBSzHashSetValue then takes the home slot of a removed pair or that slot. */
TAVO_API int TLIBISetLookDict(const TLIBSZHASH *pHash, const char *szKey);

/* Makes room for one more pair of cbNeed bytes (both NULs counted). The table grows to 4 * nSlot - 5 slots when more
 * than three quarters are in use; the string area grows when no more than cbNeed bytes are free. Returns the block,
 * which is a new one when something grew (the old one is then freed); NULL: it cannot grow and has not changed. */
TAVO_API TLIBSZHASH *PshTLIBICheckSpace(TLIBSZHASH *pHash, int cbNeed);

/* Moves all pairs to a new block of nSlot slots and cbStr bytes for text, and frees the old block. NULL, and the old
 * block as it was: no memory, or the pairs do not fit. */
TAVO_API TLIBSZHASH *PshTLIBIReSizeHash(TLIBSZHASH *pHash, int nSlot, int cbStr);

/* Adds every pair of pFrom to pTo, in slot order, without growing pTo.
 * Returns 0; -1: an argument is NULL, or a pair does not fit or its key exists already; the pairs before that one
 * have been added. */
TAVO_API int TLIBICopyHash(TLIBSZHASH *pTo, const TLIBSZHASH *pFrom);

/* Stores a new pair in a slot without a pair, without growing. Returns the slot; -1: an argument is NULL, the slot
 * is not free, or there is no room for the text. */
TAVO_API int TLIBIInsertPair(TLIBSZHASH *pHash, int slot, const char *szKey, const char *szValue);

/* Adds the pair of a key that the hash does not hold, growing when needed. Returns the block, which replaces pHash, and
 * the slot in *pSlot; NULL: a NULL argument, or the hash cannot grow and has not changed. */
TAVO_API TLIBSZHASH *PshTLIBIInsertNewPair(TLIBSZHASH *pHash, int *pSlot, const char *szKey, const char *szValue);

/* Replaces the value in *pSlot, the slot of szKey; in place when szValue is not longer. Returns and grows as
 * PshTLIBIInsertNewPair. */
TAVO_API TLIBSZHASH *PshTLIBIUpdateValue(TLIBSZHASH *pHash, int *pSlot, const char *szKey, const char *szValue);

/* Prints the header and every slot to standard output, for debugging. NULL is ignored. */
TAVO_API void TLIBIHashDump(const TLIBSZHASH *pHash);

TAVO_END_DECLS

#endif
