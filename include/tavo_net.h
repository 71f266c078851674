/*
 * Network: validators and conversions of addresses, masks and names; the wired interfaces.
 */
#ifndef TAVO_NET_H
#define TAVO_NET_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

/* The source of a card's address. */
enum { TAVO_NET_DHCP = 0, TAVO_NET_STATIC = 1 };

/* An interface. Addresses are dotted quads, "" where there is none. */
typedef struct TAVONETCARD {
    int32_t nMode; /* TAVO_NET_DHCP; anything else is static */
    char szInterface[20];
    char szIp[20];
    char szMask[20];
    char szBroadcast[20];
    char szNetwork[20];
    char szGateway[20]; /* the appliance's default gateway */
    char szMac[20];
    int32_t nMtu;  /* bytes */
    int32_t fLink; /* 1: a cable is plugged in and the other end is up */
} TAVONETCARD;

/* How interfaces are joined; the order is that of TAVONETLINKAGGR.nMode. */
enum { TAVO_NET_AGGR_NONE = 0, TAVO_NET_AGGR_LACP = 1, TAVO_NET_AGGR_ADAPTIVE = 2, TAVO_NET_AGGR_BACKUP = 3 };

#define TAVO_NET_MEMBERS 8

/* A bond: several interfaces that work as one. */
typedef struct TAVONETLINKAGGR {
    char szBond[20]; /* "bond0" */
    int32_t nMode;   /* TAVO_NET_AGGR_NONE: no bond */
    uint32_t
        fSlaveOption; /* 0: when the bond is dissolved, members without a saved file also become interfaces (DHCP) */
    int32_t nMember;
    char rgszMember[TAVO_NET_MEMBERS][20];
    char szPartner[20]; /* of an 802.3ad bond, the hardware address of the switch; "" for none. Read-only */
} TAVONETLINKAGGR;

/*
 * Validators. Each returns 1 when the text is valid, else 0 with
 *   ERR_BAD_PARAMETERS   the argument is NULL
 *   ERR_INVALID_NETNAME  the text is not valid
 * They read only their argument. Numbers of dotted quads are decimal, one to three digits each.
 */

/* An IPv4 address that a host can have: the first number is 1 to 223 but not 127, the last one at most 254. */
TAVO_API int BlTLIBIsIpAddr(const char *szAddr);

/* A contiguous IPv4 mask. A valid one is rewritten in place without leading zeros, which never makes it longer. */
TAVO_API int BlTLIBIsIpMask(char *szMask);

/* A host name of the appliance: 1 to 15 letters, digits, "-" and "_", the first a letter or "_". */
TAVO_API int BlTLIBIsHostname(const char *szName);

/* A domain name: labels of 1 to 63 letters, digits and inner hyphens, joined by dots, at most 255 bytes. */
TAVO_API int BlTLIBIsDomain(const char *szText);

/* One atom of a mail address: printable ASCII without blanks and without "(),.:;<>[]\@ and the double quote. */
TAVO_API int BlTLIBIsAtom(const char *szText);

/* A mail address: atoms joined by dots, "@", a domain name. */
TAVO_API int BlTLIBIsMailbox(const char *szText);

/* A Windows workgroup: 1 to 15 letters, digits, inner blanks and !@#$%^&()-_'{}.~ , not beginning with a dot. */
TAVO_API int BlTLIBIsWorkGroupName(const char *szName);

/* An IPv4 address and a contiguous dotted mask, joined by "/". */
TAVO_API int BlTLIBIsSubNet(const char *szSubnet);

/* An IPv6 address as inet_pton takes it; no zone. */
TAVO_API int BlTLIBIsv6IpAddrValid(const char *szAddr);

/*
 * Conversions. Both write to szOut, or over szIn when szOut is NULL; the buffer that is written must hold 64 bytes.
 * They return 0, or -1 with the buffers untouched and
 *   ERR_BAD_PARAMETERS   szIn is NULL or holds no "/"
 *   ERR_INVALID_NETNAME  the address, the mask or the length is not valid
 */

/* "192.168.1.7/255.255.255.0" becomes "192.168.1.0/24". An address with a number of 255 in it is refused. */
TAVO_API int ErrTLIBIpMaskToSubnet(char *szIn, char *szOut);

/* "10.1.2.3/8" becomes "10.0.0.0/255.0.0.0". The length, 1 to 32 bits, is read like a C literal: "/010" is 8
 * and "/0x18" is 24. */
TAVO_API int ErrTLIBSubnetToIpMask(char *szIn, char *szOut);

/*
 * Interfaces. Names are those of the kernel: 1 to 15 letters, digits and "_.:-". Other text is refused with
 * ERR_BAD_PARAMETERS before anything is read or run. Settings are in /etc/sysconfig/network-scripts/ifcfg-NAME and
 * /etc/sysconfig/network. Changes hold TAVO_LOCK_HOST, "the network lock", exclusively from beginning to end (waiting
 * at most 5 s; ERR_LOCK_FAILED) and are made by /sbin/ifconfig, /sbin/route, /sbin/dhcpcd and /etc/rc.network.
 *
 * A change is all or nothing, even when the process dies in the middle of it. Until it is complete, /etc/network.undo
 * records how to restore the network; the next function that changes the network, or TAVONetHostsRefresh, does that
 * first. After a restart of the system only the files are restored. A command that the dead process left running is
 * ended.
 */

/* Reads the first wired interface, from its file and the kernel (/sys/class/net). Returns 0 (with empty addresses when
 * it has none), or -1 with *pCard untouched and ERR_BAD_PARAMETERS (NULL), ERR_FILE_NOT_FOUND (no interface) or
 * ERR_READ_FAILED (the kernel does not say which there are).
 * Files: /etc/sysconfig/network-scripts, /etc/sysconfig/network, /sys/class/net */
TAVO_API int TAVONetGetCard1(TAVONETCARD *pCard);

/* As TAVONetGetCard1 for any interface, also for a member of a bond: ERR_FILE_NOT_FOUND when the kernel has no
 * interface of that name, ERR_BAD_PARAMETERS when the text is not a name.
 * Files: /etc/sysconfig/network-scripts, /etc/sysconfig/network, /sys/class/net */
TAVO_API int TAVONetGetCard(const char *szInterface, TAVONETCARD *pCard);

/* Sets the address of the interface pCard->szInterface. With DHCP a running client is killed, then a new one has 30 s
 * to get a lease; with a static address szIp and szMask are applied and stored. pPrevious is the previous record (NULL
 * when there is none): when the address differs, the dynamic-DNS daemon is notified. Then missing routes are added: the
 * connected networks and the default route. Further addresses stay (/sbin/ip). The stored gateway belongs to a static address of the first card. With DHCP
 * the gateway of the lease is used; the stored one only when the lease names none and there is no default route.
 * Returns 0; -2 when the interface has its address but its file could not be written; or -1 with the old address and
 * routes in force (a DHCP client that ran is started again, without waiting for it) and
 *   ERR_BAD_PARAMETERS   pCard is NULL, or its interface is not a name
 *   ERR_INVALID_NETNAME  the address or the mask is not valid
 *   ERR_LOCK_FAILED
 *   ERR_OP_FAILURE       a command failed, or the old client cannot be killed (30 attempts, one a second)
 * Files: /etc/sysconfig/network-scripts, /etc/sysconfig/network, /etc/hosts, /etc/resolv.conf,
 *   /etc/ppp/old_gateway.bak, /var/run/ddnsd.pid, /etc/network.undo
 * Runs: /sbin/ifconfig, /sbin/route, /sbin/dhcpcd, /sbin/ip
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetSetCard1(const TAVONETCARD *pCard, const TAVONETCARD *pPrevious);

/* Returns 1 when the file of the interface says BOOTPROTO=dhcp, else 0; also 0 when the lock is not free in time. A
 * file without the key gets BOOTPROTO=static; one that cannot be read is left alone.
 * Files: /etc/sysconfig/network-scripts
 * Locks: TAVO_LOCK_HOST (shared, at most 5 s) */
TAVO_API int BlTAVOLnxIsDHCP(const char *szInterface);

/* Copy the default gateway to szGateway: that of the kernel (/proc/net/route), or the stored one (GATEWAY).
 * Return 0, or -1 with ERR_BAD_PARAMETERS, ERR_KEY_NOT_FOUND (there is none), ERR_NOT_ENOUGH_MEMORY (the buffer is too
 * small; 16 bytes always suffice), ERR_OPEN_FAILED, ERR_FORMAT_ERROR (the kernel's table has an unknown form).
 * Files: /proc/net/route, /etc/sysconfig/network */
TAVO_API int TAVONetDefaultGatewayGet(char *szGateway, int cbGateway);
TAVO_API int TAVONetDefaultGatewayGetConf(char *szGateway, int cbGateway);

/* Makes szGateway the default gateway and stores it. Returns 0, or -1 with the old gateway in force and stored and
 * ERR_BAD_PARAMETERS (NULL), ERR_INVALID_NETNAME, ERR_LOCK_FAILED, ERR_OP_FAILURE (it cannot be reached from any
 * interface) or a code of the settings files.
 * Files: /etc/sysconfig/network, /etc/network.undo
 * Runs: /sbin/route
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetDefaultGatewaySet(const char *szGateway);

/* Copies the stored host name to szName (16 bytes always suffice). Returns 0, or -1 with ERR_BAD_PARAMETERS,
 * ERR_KEY_NOT_FOUND (none is stored), ERR_NOT_ENOUGH_MEMORY or ERR_OPEN_FAILED.
 * Files: /etc/sysconfig/network */
TAVO_API int TAVOLnxGetHostname(char *szName, int cbName);

/* Stores the host name, rewrites the two lines of /etc/hosts that name localhost and the appliance (the administrator's
 * lines stay; the name gets the address of the first wired interface that has one, or 127.0.1.1), and sets the kernel's
 * host name. Returns 0, or -1 with the old name everywhere and ERR_BAD_PARAMETERS (NULL), ERR_INVALID_NETNAME,
 * ERR_LOCK_FAILED, ERR_SYS_UNKNOWN (the kernel refused) or a code of the settings files.
 * Files: /etc/sysconfig/network, /etc/hosts, /etc/network.undo
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVOLnxSetHostname(const char *szName);

/* Rewrites the line of /etc/hosts that names the appliance if it is out of date: the host name (the kernel's when none
 * is stored) with the address of the first wired interface that has one, or with 127.0.1.1. Functions that change an
 * address do that themselves; this one is for the hook of the DHCP client and for the start of the network. It also
 * completes an interrupted change. It never waits: while another process holds the network lock it does nothing, and
 * the holder rewrites the file when it is done.
 * Returns 0 (the file is up to date), 1 (left to the holder of the lock), or -1 with ERR_CREATE_FAILED or
 * ERR_OPEN_FAILED (of the lock files) or a code of the settings files.
 * Files: /etc/hosts, /etc/network.undo
 * Locks: TAVO_LOCK_HOST (exclusive, without waiting) */
TAVO_API int TAVONetHostsRefresh(void);

/*
 * A checkpoint of the whole network: addresses, routes of both families, MTU, link state, wake-on-LAN, DHCP clients, host
 * name, bonds and the files under /etc. A program takes one, changes the network by any number of calls or commands, and
 * then keeps the result or restores everything. The checkpoint is in /etc/network.checkpoint and belongs to the process that
 * took it: when that process has died, the next function that changes the network, or TAVONetHostsRefresh, restores the
 * network (after a restart of the system, the files). All three functions hold the network lock while they work. They
 * return 0, or -1 with ERR_LOCK_FAILED or the codes named here.
 */

/* Takes a checkpoint for the calling process. ERR_FILE_EXISTS: another running process has one. ERR_READ_FAILED (one of
 * the files cannot be read), or a code of the settings files: no checkpoint was taken.
 * Files: /etc/network.checkpoint, /etc/network.undo
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetCheckpointTake(void);

/* Ends the checkpoint and keeps the present network. Any process may do that. ERR_FILE_NOT_FOUND: there is
 * none, or its process has died and the network has just been restored. ERR_REMOVE_FAILED: it could not be removed.
 * Files: /etc/network.checkpoint, /etc/network.undo
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetCheckpointEnd(void);

/* Restores the network of the time when the checkpoint was taken, and ends the checkpoint. Unchanged interfaces are
 * left alone. When interfaces were added or removed (bonds, VLANs), /etc/rc.network stops the network and starts it
 * with the old files. A DHCP client that ran is started again without waiting for it. ERR_FILE_NOT_FOUND: there is
 * none. ERR_OP_FAILURE: an address could not be set; everything else has been restored.
 * Files: /etc/network.checkpoint, /etc/network.undo, /etc/sysconfig/network-scripts, /etc/sysconfig/network, /etc/hosts,
 *   /etc/resolv.conf, /etc/tavoinfo.conf
 * Runs: /sbin/ifconfig, /sbin/route, /sbin/ip, /sbin/dhcpcd, /etc/rc.network
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetCheckpointPutBack(void);

/* Pushes the name servers of /etc/resolv.conf onto *ppServers, which may move. Returns their number, or -1 with
 * ERR_BAD_PARAMETERS, ERR_OPEN_FAILED or ERR_OUT_OF_MEMORY.
 * Files: /etc/resolv.conf */
TAVO_API int TAVONetDNSGet(TLIBSZLIST **ppServers);

/* Replaces /etc/resolv.conf (if it is a link, the file that it leads to) by one "nameserver" line for each address,
 * IPv4 or IPv6. Returns 0, or -1 with the old file in place and ERR_BAD_PARAMETERS (NULL), ERR_INVALID_NETNAME (not an
 * address), ERR_LOCK_FAILED or a code of the settings files.
 * Files: /etc/resolv.conf, /etc/network.undo
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetDNSSet(const TLIBSZLIST *pServers);

/* Read the MTU of an interface in bytes, stored as "NAME_mtu" in /etc/tavoinfo.conf; 1500 when none is stored.
 * TAVOConfGetMTUValue copies the text to szMtu (16 bytes always suffice) and returns 0, or -1 with ERR_BAD_PARAMETERS
 * or
 * ERR_NOT_ENOUGH_MEMORY. TAVOGetMTUSetting returns the number, or -1 with ERR_BAD_PARAMETERS or ERR_FORMAT_ERROR (the
 * stored text is not an MTU).
 * Files: /etc/tavoinfo.conf */
TAVO_API int TAVOConfGetMTUValue(const char *szInterface, char *szMtu, int cbMtu);
TAVO_API int TAVOGetMTUSetting(const char *szInterface);

/* Set the MTU, 68 to 65535 bytes: TAVOConfSetMTUValue the stored one (under the lock of the system settings),
 * TAVONetSetMTUEth the kernel's (under the network lock), TAVONetSetMTUValue both, under both locks. It sets the
 * kernel's first, so that an MTU that the card refuses is not stored.
 * Return 0, or -1 with nothing changed and ERR_BAD_PARAMETERS, ERR_LOCK_FAILED, ERR_OP_FAILURE (ifconfig failed) or a
 * code of the settings files.
 * Files: /etc/tavoinfo.conf, /etc/network.undo
 * Runs: /sbin/ifconfig
 * Locks: TAVO_LOCK_TAVOINFO (exclusive, at most 5 s), TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVOConfSetMTUValue(const char *szInterface, int mtu);
TAVO_API int TAVONetSetMTUEth(const char *szInterface, int mtu);
TAVO_API int TAVONetSetMTUValue(const char *szInterface, int mtu);

/* Returns 1 when another host answers for szAddr (one ping, at most 2 s); 0 when none does or the interface itself has
 * the address; -1 with ERR_BAD_PARAMETERS, or ERR_OP_FAILURE when /bin/ping cannot be run.
 * Runs: /bin/ping */
TAVO_API int TAVOIIpConflict(const char *szInterface, const char *szAddr);

/* Makes the same check before the interface takes the address, by ARP as in RFC 5227. So it also notices a host that
 * does not answer pings and one that is just taking the address. Returns 1 or 0; when no host answers, after 4 to 7
 * times cMilliseconds (1 to 10000; 1000 in the RFC). -1 with ERR_BAD_PARAMETERS, ERR_ACCESS_DENIED (root only),
 * ERR_FILE_NOT_FOUND (no such interface) or
 * ERR_OP_FAILURE (the interface is down). */
TAVO_API int TAVONetAddressProbe(const char *szInterface, const char *szAddr, int cMilliseconds);

/* Returns 1 when the interface has a link: a cable is plugged in and the other end is up; else 0.
 * Files: /sys/class/net */
TAVO_API int BlTLIBIsConnected(const char *szInterface);

/* Returns 1 when a TCP or UDP socket has the local port (1 to 65535; /proc/net/tcp and /proc/net/udp, with IPv6 also
 * tcp6 and udp6), else 0; also 0 with ERR_BAD_PARAMETERS or ERR_OPEN_FAILED.
 * Files: /proc/net/tcp, /proc/net/udp, /proc/net/tcp6, /proc/net/udp6 */
TAVO_API int BlTLIBIsPortInUse(int port);

/* Add or remove the route to a network through an interface, which may be the dial-up one, ppp0. Return 0, or -1 with
 * ERR_BAD_PARAMETERS, ERR_INVALID_NETNAME (not an address, not a contiguous mask, or bits of the address outside the
 * mask),
 * ERR_LOCK_FAILED or ERR_OP_FAILURE (the tool failed: the route exists already, or there is none to remove).
 * Runs: /sbin/route
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetRouteAdd(const char *szNet, const char *szMask, const char *szInterface);
TAVO_API int TAVONetRouteDel(const char *szNet, const char *szMask, const char *szInterface);

/* Asks whether a DHCP server answers on an interface within cSeconds (at least 1), without taking a lease (/sbin/dhcpcd
 * -T). Returns 0 when one answers, 1 when none does, or -1 with ERR_BAD_PARAMETERS or ERR_OP_FAILURE (the client cannot
 * be run).
 * Runs: /sbin/dhcpcd */
TAVO_API int TAVONetDhcpTest(const char *szInterface, int cSeconds);

/*
 * IPv6. The functions that change an interface do so in the kernel first and then store in its file what the start-up
 * scripts need (IPV6INIT, IPV6ADDR, IPV6PREFIXLENG). They return 0; -2 when the kernel has the change but the file
 * could not be written; or -1 with nothing changed and
 *   ERR_BAD_PARAMETERS   a pointer is NULL, or the interface is not a name
 *   ERR_INVALID_NETNAME  the address, the network or the gateway is not valid, or nPrefix is not 0 to 128 bits
 *   ERR_LOCK_FAILED
 *   ERR_OP_FAILURE       the kernel refused: no such interface, no IPv6, it exists already, or there is none to remove
 */

/* Enables (fEnable not 0) or disables IPv6 on an interface.
 * Files: /proc/sys/net/ipv6/conf (written), /etc/sysconfig/network-scripts, /etc/network.undo
 * Runs: /bin/echo
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetIPv6Set(const char *szInterface, int fEnable);

/* Returns 1 when IPv6 is enabled on the interface, else 0; also 0 with ERR_BAD_PARAMETERS or ERR_OPEN_FAILED (there is
 * no such interface, or the kernel has no IPv6).
 * Files: /proc/sys/net/ipv6/conf */
TAVO_API int BlTAVONetIPv6IsEnabled(const char *szInterface);

/* Add an address to an interface and remove it (/sbin/ip). Only the address that was added last is stored.
 * Files: /etc/sysconfig/network-scripts, /etc/network.undo
 * Runs: /sbin/ip
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetIPv6AddrAdd(const char *szInterface, const char *szAddr, int nPrefix);
TAVO_API int TAVONetIPv6AddrDel(const char *szInterface, const char *szAddr, int nPrefix);

/* Pushes the addresses of an interface, as "ADDRESS/PREFIX", onto *ppAddrs, which may move (/proc/net/if_inet6).
 * Returns their number, which is 0 when the kernel has no IPv6, or -1 with ERR_BAD_PARAMETERS, ERR_OPEN_FAILED (the
 * kernel's table cannot be read) or ERR_OUT_OF_MEMORY.
 * Files: /proc/net/if_inet6 */
TAVO_API int TAVONetIPv6AddrEnum(const char *szInterface, TLIBSZLIST **ppAddrs);

/* Add or remove the route to a network, in the kernel only; "::" with the length 0 is the default route. szGateway is
 * the router's address, NULL for a network that the interface itself is on.
 * Runs: /sbin/ip
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetIPv6RouteAdd(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway);
TAVO_API int TAVONetIPv6RouteDel(const char *szInterface, const char *szNet, int nPrefix, const char *szGateway);

/* Waits for the DHCPv6 client (dhcp6c) of an interface to end, cSeconds at most. Returns 0 when none runs, or -1 with
 * ERR_BAD_PARAMETERS or ERR_TIMER_EXPIRED. */
TAVO_API int TAVONetDhcp6Wait(const char *szInterface, int cSeconds);

/*
 * Wake-on-LAN: only where "support_wol" in /etc/tavoinfo.conf is "yes" (else ERR_OP_UNREGISTERED). On most models the
 * card is queried and configured; where the factory settings say "wol_by_panel" the controller of the front panel
 * (/dev/ttyS1) does the waking. Common codes: ERR_BAD_PARAMETERS, ERR_OP_FAILURE (the card or the controller refuses).
 */

/* Returns 1 when the interface wakes the appliance, 0 when it does not, -1 on error.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf */
TAVO_API int TAVONetWolGet(const char *szInterface);

/* Enables (fEnable not 0) or disables waking by the interface, and stores that as "NAME_wol_options". The packets that
 * wake the appliance are the letters of ethtool, such as "g", in "wol_enabled_options" of /etc/tavoinfo.conf. The
 * controller of a front panel can only be switched on (else ERR_OP_UNREGISTERED); that happens under TAVO_LOCK_TTYS1.
 * Returns 0, or -1 with nothing changed and ERR_KEY_NOT_FOUND (no options to enable), ERR_FORMAT_ERROR (unknown letters),
 * ERR_LOCK_FAILED or a code of the settings files.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /etc/network.undo, /dev/ttyS1
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s), TAVO_LOCK_TAVOINFO (exclusive, at most 5 s), TAVO_LOCK_TTYS1
 *   (exclusive, at most 5 s) */
TAVO_API int TAVONetWolSet(const char *szInterface, int fEnable);

/*
 * Link aggregation.
 */

/* Pushes the names of the kernel's bonds onto *ppBonds, which may move (/sys/class/net/bonding_masters). Returns
 * their number, or -1 with ERR_BAD_PARAMETERS or ERR_OUT_OF_MEMORY.
 * Files: /sys/class/net/bonding_masters */
TAVO_API int TAVONetLinkAggrEnum(TLIBSZLIST **ppBonds);

/* The same for the member interfaces of a bond; 0 for a bond that does not exist. */
TAVO_API int TAVONetLinkAggrPhyGet(const char *szBond, TLIBSZLIST **ppMembers);

/* Reads a bond from the kernel; one that does not exist has the mode TAVO_NET_AGGR_NONE. Returns 0, or -1 with
 * ERR_BAD_PARAMETERS, or ERR_LINK_AGGR_OPTION when the kernel's bond has a mode that the appliance does not offer.
 * Files: /sys/class/net, /proc/net/bonding */
TAVO_API int TAVONetLinkAggrGet(const char *szBond, TAVONETLINKAGGR *pAggr);

/* Adds an interface to the members of a record, unless it is one already. Changes only the record. Returns 0, or -1
 * with
 * ERR_BAD_PARAMETERS, ERR_LINK_AGGR_TYPE (not an Ethernet interface, or a bond itself) or ERR_LINK_AGGR_OPTION (the
 * record has TAVO_NET_MEMBERS already). */
TAVO_API int TAVONetLinkAggrOptSlsaveAdd(TAVONETLINKAGGR *pAggr, const char *szInterface);

/* Creates or changes the bond as the record says, or dissolves it. The network is stopped (/etc/rc.network), the
 * interface files are written (a member's old file is kept as ifcfg-NAME.saved and comes back when the bond is
 * dissolved; a new bond takes over the first member's address, a changed one keeps its own), and the network is started
 * again. Nothing is done when the bond already matches the record. Wherever the process dies, the files describe a
 * network that starts.
 * Returns 0, or -1 with ERR_BAD_PARAMETERS, ERR_LINK_AGGR_TYPE (szBond is an interface but not a bond),
 * ERR_LOCK_FAILED,
 * ERR_READ_FAILED or ERR_WRITE_FAILED (the files are unchanged, and the network is started) or ERR_OP_FAILURE (the
 * network could not be stopped or did not start; the old files are back, and the old network was started).
 * Files: /etc/sysconfig/network-scripts, /etc/network.undo
 * Runs: /etc/rc.network, /bin/cp, /bin/mv
 * Locks: TAVO_LOCK_HOST (exclusive, at most 5 s) */
TAVO_API int TAVONetLinkAggrSet(const TAVONETLINKAGGR *pAggr);

TAVO_END_DECLS

#endif
