/*
 * String list: an ordered collection of strings in one heap block.
 *
 * The block holds the header, the item table and copies of all strings, so one TLIBSzListFree releases everything.
 * A list that has to grow moves: functions that can add text take the address of the caller's pointer, replace it
 * and free the old block. A returned string points into the block and is valid until the next call that may grow,
 * rebuild or free the list; it may be passed to that call, also when the call moves the block.
 *
 * Sizes are counted in 32-bit words on every target: the header counts 24 bytes and an item slot 4. On a 64-bit host
 * the block is physically larger than nSize says, and every list grows at the same insertion as on the appliance.
 *
 * A block whose nSize is smaller than the header was overwritten or never initialised: functions that would have to
 * grow it fail with ERR_BAD_PARAMETERS, as for NULL.
 *
 * A list belongs to one thread at a time; nothing is locked. Indexes begin at 0. A code is recorded only for
 * failures that name one.
 */
#ifndef TAVO_LIST_H
#define TAVO_LIST_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/* Values of fMode: the order of the items. */
enum {
    TLIB_SZLIST_UNSORTED = 0x00,
    TLIB_SZLIST_SORTED = 0x01,    /* by bytes, as strcmp does */
    TLIB_SZLIST_CASESORTED = 0x10 /* by UTF-8 text without regard to case, as TLIBUnicodeUTF8StrCaseCmp does */
};

/* Flag of the set operations: return the result in a new list. */
enum { TLIB_SZLIST_NEW = 0x1000 };

#ifdef __clang__
#pragma clang diagnostic push
#pragma clang diagnostic ignored "-Wc99-extensions"
#endif

typedef struct TLIBSZLIST {
    int32_t nSize; /* size of the block in bytes, at least 512, counted as said above */
    int32_t nItem; /* item slots in use */
    int32_t nFree; /* nSize - 24 - 4 * nItem - bytes of the stored strings; a removed or replaced string keeps its bytes
                      until the list grows or is emptied */
    int32_t fMode; /* a TLIB_SZLIST_ mode; any other value that was passed to TLIBSzListSortItems: not sorted */
    char *EndofFree; /* lowest address in use by a string; strings are packed downward from the end of the block */
    char *pszEmpty;  /* the block's last byte, always 0; the slot of a hole points to it */
    __extension__ char *pszItem[]; /* nItem pointers to strings in this block */
} TLIBSZLIST;

#ifdef __clang__
#pragma clang diagnostic pop
#endif

/* Creates an empty, unsorted list of cbSize bytes, at least 512. The caller frees it with TLIBSzListFree.
 * Returns NULL with ERR_OUT_OF_MEMORY. */
TAVO_API TLIBSZLIST *PslTLIBSzListAlloc(int cbSize);

/* Frees the list with all its strings. NULL is ignored. */
TAVO_API void TLIBSzListFree(TLIBSZLIST *pList);

/* Returns the item at index i, which points into the list; the empty string for a hole.
 * NULL with ERR_BAD_PARAMETERS: pList is NULL, or there is no such index. */
TAVO_API char *SzTLIBSzListGet(const TLIBSZLIST *pList, int i);

/* Inserts a copy of sz at index i and moves the items from there on up by one. An index beyond the end leaves holes
 * in between. A sorted list ignores i and inserts the copy at its place in the order, before an equal item.
 * Returns the index of the new item, or -1 with
 *   ERR_BAD_PARAMETERS  ppList, *ppList or sz is NULL, or i is negative
 *   ERR_OUT_OF_MEMORY   the list cannot grow; it has not changed */
TAVO_API int TLIBSzListInsert(TLIBSZLIST **ppList, int i, const char *sz);

/* TLIBSzListInsert at the end; the same results. */
TAVO_API int TLIBSzListPush(TLIBSZLIST **ppList, const char *sz);

/* TLIBSzListInsert at the beginning; the same results. */
TAVO_API int TLIBSzListUnshift(TLIBSZLIST **ppList, const char *sz);

/* Removes the item at index i and returns it; the string is still in the list's block.
 * NULL with ERR_BAD_PARAMETERS: pList is NULL, or there is no such index. */
TAVO_API char *SzTLIBSzListRemove(TLIBSZLIST *pList, int i);

/* Removes the first item; returns as SzTLIBSzListRemove. */
TAVO_API char *SzTLIBSzListShift(TLIBSZLIST *pList);

/* Removes the last item; returns as SzTLIBSzListRemove. */
TAVO_API char *SzTLIBSzListPop(TLIBSZLIST *pList);

/* Empties the list and makes its whole block free again. Mode and size stay. NULL is ignored. */
TAVO_API void TLIBSzListRemoveAll(TLIBSZLIST *pList);

/* Replaces the item at index i by a copy of sz; in place when sz is not longer. A sorted list is sorted again.
 * Returns the index of the new item, or -1 with
 *   ERR_BAD_PARAMETERS  ppList, *ppList or sz is NULL, or there is no such index; nothing has changed. Also for a list
 *                       of mode TLIB_SZLIST_CASESORTED, in which TLIBSzListFind cannot look up the new index: there the
 *                       replacement is done, and the list sorted again
 *   ERR_OUT_OF_MEMORY   the list cannot grow; it has not changed */
TAVO_API int TLIBSzListSet(TLIBSZLIST **ppList, int i, const char *sz);

/* Finds sz by bytes; a binary search in a sorted list. Holes are never found in an unsorted list.
 * Returns the index (the first one in an unsorted list), or -1: without a code when sz is not there, with
 *   ERR_BAD_PARAMETERS  an argument is NULL, or the list is of mode TLIB_SZLIST_CASESORTED */
TAVO_API int TLIBSzListFind(const TLIBSZLIST *pList, const char *sz);

/* Finds sz without regard to case. Text that is not UTF-8 is never found. Returns as TLIBSzListFind, with
 *   ERR_BAD_PARAMETERS  an argument is NULL, or the list is of mode TLIB_SZLIST_SORTED */
TAVO_API int TLIBSzListCaseFind(const TLIBSZLIST *pList, const char *sz);

/* Sets the list's mode. An unsorted list (mode 0) is sorted first, and its holes dropped: by bytes when bit 0x01 of
 * mode is set, else without regard to case when bit 0x10 is; equal items in no particular order, text that is not
 * UTF-8 last, bytewise. Any other list only gets the new mode and keeps its order. NULL is ignored. */
TAVO_API void TLIBSzListSortItems(TLIBSZLIST *pList, int mode);

/* The list's mode. -1 with ERR_BAD_PARAMETERS: pList is NULL. */
TAVO_API int TLIBSzListSorted(const TLIBSZLIST *pList);

/*
 * Set operations. fFlags 0 works in place on the first list, whose holes are dropped, and returns it; fFlags
 * TLIB_SZLIST_NEW leaves it alone and returns a new list for the caller to free, of the first list's mode when that is
 * sorted. The second list is never changed. Holes take no part. Both may be the same list.
 *
 * Items match by bytes when the second list is unsorted; otherwise by the order of the second list, through binary
 * search, or in one walk over both when the first list is sorted too. A case search never matches text that is not
 * UTF-8. The result keeps the order of the first list.
 *
 * NULL with
 *   ERR_BAD_PARAMETERS  a list is NULL, both are sorted but in different modes, or fFlags has another value
 *   ERR_OUT_OF_MEMORY   no memory for the result; the first list has not changed, except for dropped holes
 */

/* The items of pA that are in pB. */
TAVO_API TLIBSZLIST *PslTLIBSzListAnd(TLIBSZLIST *pA, const TLIBSZLIST *pB, int fFlags);

/* All items of *ppA, then the items of pB that *ppA does not hold at the time of the call, in the order of pB; in a
 * sorted list each of these goes to its place. In place the list may move: *ppA is then replaced. */
TAVO_API TLIBSZLIST *PslTLIBSzListOr(TLIBSZLIST **ppA, const TLIBSZLIST *pB, int fFlags);

/* The items of pA that are not in pB. */
TAVO_API TLIBSZLIST *PslTLIBSzListSub(TLIBSZLIST *pA, const TLIBSZLIST *pB, int fFlags);

/* Joins the items with szSep between them into szBuf of cbBuf bytes. Text that does not fit is cut at cbBuf - 1 bytes;
 * it always ends in NUL and the rest of the buffer is cleared.
 * Returns 0 or more, which is not a length, when the whole text fits. -1 with
 *   ERR_BAD_PARAMETERS  an argument is NULL or cbBuf is not positive; also logged
 *   ERR_TRUNCATED       the text was cut */
TAVO_API int TLIBSzListDump2Str(const TLIBSZLIST *pList, const char *szSep, char *szBuf, int cbBuf);

/* Prints the list's addresses, items and header to standard output, for debugging. NULL is ignored. */
TAVO_API void TLIBISzListDump(const TLIBSZLIST *pList);

/* Binary search for sz among the items lo to hi: by bytes, or without regard to case when fCase is set. A case
 * search ends at the first item that is not UTF-8. Bounds outside the list are moved to its ends.
 * Returns an index, or -(place + 1) where place is where sz would be inserted; -1 when hi is -1. -1 with
 * ERR_BAD_PARAMETERS: an argument is NULL. */
TAVO_API int TLIBISzListFind(const TLIBSZLIST *pList, int hi, int lo, const char *sz, int fCase);

/* Drops the holes and keeps the order. NULL is ignored. */
TAVO_API void TLIBISzListClean(TLIBSZLIST *pList);

/* Copies the list into a new block of twice the size, without the bytes of removed strings, and frees the old block.
 * Returns NULL, the old block unchanged, with
 *   ERR_BAD_PARAMETERS  pList is NULL
 *   ERR_OUT_OF_MEMORY   no memory, or the size would pass 2^31 - 1 */
TAVO_API TLIBSZLIST *PslTLIBISzListExpand(TLIBSZLIST *pList);

/* The two orders, for qsort: each argument is the address of an item pointer. The second sorts text that is not
 * UTF-8 last, bytewise. */
TAVO_API int TLIBISzListStrcmp(const void *pLeft, const void *pRight);
TAVO_API int TLIBISzListUTF8StrCasecmp(const void *pLeft, const void *pRight);

TAVO_END_DECLS

#endif
