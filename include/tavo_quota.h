/*
 * Quotas: limits on the space that a user may take on a volume.
 */
#ifndef TAVO_QUOTA_H
#define TAVO_QUOTA_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* 1 when "supportquota" is "yes" (any case) in /etc.defaults/tavoinfo.conf, else 0. */
TAVO_API int TAVOSupportQUOTA(void);

/* Clears the limits of the listed users on every volume that has quotas. Returns 0 or -1. */
TAVO_API int TAVOQuotaCleanAllVols(const TLIBSZLIST *pslUsers);

TAVO_END_DECLS

#endif
