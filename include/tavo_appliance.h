/*
 * What the rest of the appliance tells the library: the model's limits and the hardware around it.
 *
 * The model's capabilities stand in /etc.defaults/tavoinfo.conf, which never changes after manufacture; expansion units
 * are found in /sys. Nothing is locked, nothing is cached.
 */
#ifndef TAVO_APPLIANCE_H
#define TAVO_APPLIANCE_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/* --- storage --- */

enum { TAVO_EBOX_DISKS = 26 };

/* An expansion unit: several disks behind one port. */
typedef struct TAVOEBOX {
    int32_t iUnit;    /* 1 for the first; its letter is the first of the disks' two */
    int32_t iPort;    /* index of the internal port that leads to it, from 0 */
    int32_t fPoweron; /* 1 when it has power */
    int32_t nDisk;
    char rgszDisk[TAVO_EBOX_DISKS][16]; /* "/dev/sdaa" */
} TAVOEBOX;

/* The number of internal bays: "maxdisks", 1 to 10; 4 when the model does not say. */
TAVO_API int TAVOMaxDiskGet(void);

/* Returns 1 when the internal port iPort (from 0) leads to an expansion unit and is no bay, else 0. Always 0 on a model
 * without "supportebox". */
TAVO_API int TAVOEBoxDevIs(int iPort);

/* Gives all expansion units, in the order of their ports, as a heap array for free. Returns their number; 0 with *ppBox
 * NULL when there is none or the model has no support for them; -1 with ERR_BAD_PARAMETERS (ppBox is NULL),
 * ERR_OPEN_FAILED (/sys cannot be searched) or ERR_OUT_OF_MEMORY. */
TAVO_API int TAVOEBoxInfoEnum(TAVOEBOX **ppBox);

/* Returns 1 when the unit has power, else 0; 0 with ERR_BAD_PARAMETERS for NULL. */
TAVO_API int TAVOEBoxIsPoweron(const TAVOEBOX *pBox);

/* The largest size of an array member that the model uses, "raidsizelimit", in KiB; 0 without a limit. */
TAVO_API unsigned long RAIDSizeLimitGet(void);

TAVO_END_DECLS

#endif
