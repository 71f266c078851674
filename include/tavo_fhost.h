/*
 * Discovery of other appliances: the query packets, their broadcast, and the list of hosts that answered.
 *
 * Appliances on one network find each other by UDP broadcast on port 9999. The daemon /usr/tavo/bin/findhostd (pid file
 * /var/run/findhostd.pid) answers queries and writes who answered ours to /tmp/tavods.list; docs/discovery.md has the
 * packets and the list.
 */
#ifndef TAVO_FHOST_H
#define TAVO_FHOST_H

#include "tavo_error.h"
#include "tavo_hash.h"

TAVO_BEGIN_DECLS

/* The header of every packet, and the three queries, byte for byte; beside each its length in bytes. The library itself
 * sends stFHOSTBroadCastVDS20. */
extern TAVO_API const uint8_t stFHOSTHeader[8];
extern TAVO_API const uint8_t stFHOSTBroadCast[10];
extern TAVO_API const uint8_t stFHOSTBroadCastV11[20];
extern TAVO_API const uint8_t stFHOSTBroadCastVDS20[20];
extern TAVO_API const int32_t FHOSTHeaderSize;
extern TAVO_API const int32_t FHOSTBroadCastSize;
extern TAVO_API const int32_t FHOSTBroadCastSizeV11;
extern TAVO_API const int32_t FHOSTBroadCastSizeVDS20;

/* Sends a packet of cbPacket bytes to 255.255.255.255, port 9999, from the address of each of the first eight wired
 * interfaces. An interface for which neither the kernel nor its file has an address is passed over: nothing is plugged
 * in, or no DHCP server has answered. Returns the interfaces from which the packet could not be sent, bit i for interface
 * i: the send failed, the kernel lacks the address that the file of a static interface has, or the interface cannot be
 * read. 0: sent from all that have an address. Failures are logged; no code is set. */
TAVO_API uint32_t ErrFHOSTSendBroadcastUdp(const void *pPacket, int cbPacket);

/* Sends the query twice, since broadcasts get lost, and joins the two results. */
TAVO_API uint32_t ErrFHOSTSendQueryPkt(void);

/* Collects the hosts on the network: starts findhostd when it does not run (3 s more), sends the query, waits 10 s for
 * the answers, and moves the list to /tmp/tavods.list.tmp for TAVOFHOSTGet2Hash. Two callers at the same time take each
 * other's list.
 * Returns 0, or -1 when the daemon does not start, an interface could not send, or the list cannot be made or moved.
 * What somebody else left in the list's place is removed first. */
TAVO_API int TAVOFHOSTDumpHost(void);

/* Reads the collected list into the caller's hash *ppshHosts, which may move: a key "NAME(ADDRESS)" with the value
 * ADDRESS for each host. What the hosts say of themselves is not to be trusted: a line whose address is none is skipped,
 * a name is at most 255 bytes long. The list is deleted once it could be opened.
 * Returns the number of pairs in the hash, 0 with ERR_OPEN_FAILED when there is no list (or what stands there is not
 * ours), or -1 with ERR_BAD_PARAMETERS (NULL), ERR_READ_FAILED or ERR_OUT_OF_MEMORY. */
TAVO_API int TAVOFHOSTGet2Hash(TLIBSZHASH **ppshHosts);

TAVO_END_DECLS

#endif
