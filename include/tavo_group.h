/*
 * Local groups.
 */
#ifndef TAVO_GROUP_H
#define TAVO_GROUP_H

#include "tavo_error.h"
#include "tavo_hash.h"

TAVO_BEGIN_DECLS

/* Applies renames and deletions of users to the member lists of all groups: pshNames maps upper-case old names to new
 * names, "" for a deleted user. Returns 0 or -1. */
TAVO_API int TAVOUserModifyGroup(const TLIBSZHASH *pshNames);

TAVO_END_DECLS

#endif
