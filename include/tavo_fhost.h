/*
 * Discovery of other appliances: the query packets, their broadcast, and the list of hosts that answered.
 *
 * Appliances on one network find each other by UDP broadcast on port 9999. The daemon /usr/tavo/bin/findhostd (pid file
 * /var/run/findhostd.pid) answers queries and writes the hosts that answered ours to /tmp/tavods.list;
 * docs/discovery.md describes the packets and the list.
 */
#ifndef TAVO_FHOST_H
#define TAVO_FHOST_H

#include "tavo_error.h"
#include "tavo_hash.h"

TAVO_BEGIN_DECLS

/* The header of every packet, the three queries, and the length of each in bytes. The library itself sends
 * stFHOSTBroadCastVDS20. */
extern TAVO_API const uint8_t stFHOSTHeader[8];
extern TAVO_API const uint8_t stFHOSTBroadCast[10];
extern TAVO_API const uint8_t stFHOSTBroadCastV11[20];
extern TAVO_API const uint8_t stFHOSTBroadCastVDS20[20];
extern TAVO_API const int32_t FHOSTHeaderSize;
extern TAVO_API const int32_t FHOSTBroadCastSize;
extern TAVO_API const int32_t FHOSTBroadCastSizeV11;
extern TAVO_API const int32_t FHOSTBroadCastSizeVDS20;

/* Sends a packet of cbPacket bytes to 255.255.255.255, port 9999, from the address of each of the first eight wired
 * interfaces. An interface for which neither the kernel nor its file has an address is skipped: nothing is plugged in,
 * or no DHCP server has answered.
 * Returns the interfaces from which the packet could not be sent, bit i for interface i: the send failed, the kernel
 * lacks the address that the file of a static interface has, or the interface cannot be read. 0: sent from every
 * interface with an address. Failures are logged; no code is set. */
TAVO_API uint32_t ErrFHOSTSendBroadcastUdp(const void *pPacket, int cbPacket);

/* Sends the query twice, because broadcasts get lost, and returns the bits of both results. */
TAVO_API uint32_t ErrFHOSTSendQueryPkt(void);

/* Collects the hosts on the network: starts findhostd when it does not run (3 s more), sends the query, waits 10 s for
 * the answers, and moves the list to /tmp/tavods.list.tmp for TAVOFHOSTGet2Hash. Do not call it twice at the same time:
 * one caller would take the other's list.
 * The daemon counts as running when a process of root holds the lock of its pid file.
 * Returns 0, or -1 with ERR_OP_FAILURE (the daemon does not start, or an interface could not send), ERR_CREATE_FAILED
 * or
 * ERR_RENAME_FAILED (the list cannot be made or moved). A foreign file at the list's path is removed first; a folder
 * there is renamed.
 * Files: /tmp/tavods.list, /var/run/findhostd.pid
 * Runs: /usr/tavo/bin/findhostd */
TAVO_API int TAVOFHOSTDumpHost(void);

/* Reads the collected list into the caller's hash *ppshHosts, which may move: a key "NAME(ADDRESS)" with the value
 * ADDRESS for each host. Do not trust what the hosts say about themselves. A line without a valid address is skipped; a
 * name is at most 255 bytes long. The list is deleted as soon as it has been opened.
 * Returns the number of pairs in the hash, 0 with ERR_OPEN_FAILED when the list does not exist or belongs
 * neither to root nor to the caller, or -1 with ERR_BAD_PARAMETERS (NULL), ERR_READ_FAILED or ERR_OUT_OF_MEMORY.
 * Files: /tmp/tavods.list */
TAVO_API int TAVOFHOSTGet2Hash(TLIBSZHASH **ppshHosts);

/* An appliance as it describes itself. Trust only the address. */
typedef struct TAVOFHOST {
    uint32_t nModel;
    uint32_t nProtocol;   /* 240 or more */
    char szName[256];     /* not empty; findhostd lists UTF-8 text without control characters, at most 63 bytes */
    char szIp[20];        /* dotted quad, on the network of szInterface */
    char szInterface[20]; /* on which the answer came */
} TAVOFHOST;

/* Called with a host, which is valid during the call, and the caller's own pointer. A result other than 0 ends the
 * search. */
typedef int (*TAVOFHOSTCALLBACK)(const TAVOFHOST *pHost, void *pContext);

/* Asks the network for appliances as TAVOFHOSTDumpHost does, and passes each to the callback once, at most a second
 * after findhostd has listed it. It watches for cSeconds (10 are enough for a quiet network) and leaves the list in
 * place, so any number of callers can search at the same time. Hosts that answered another query in the last 15 s are
 * also passed, at the beginning.
 * Returns the number of hosts passed to the callback, or -1 with ERR_BAD_PARAMETERS (pfnHost is NULL, cSeconds below
 * 1),
 * ERR_OP_FAILURE (the daemon does not start, or an interface could not send and no host answered on the others) or
 * ERR_OUT_OF_MEMORY.
 * Files: /tmp/tavods.list */
TAVO_API int TAVOFHOSTEnum(TAVOFHOSTCALLBACK pfnHost, void *pContext, int cSeconds);

TAVO_END_DECLS

#endif
