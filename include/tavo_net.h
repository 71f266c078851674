/*
 * Network: validators and conversions of addresses, masks and names; the wired interfaces.
 */
#ifndef TAVO_NET_H
#define TAVO_NET_H

#include "tavo_error.h"

TAVO_BEGIN_DECLS

/*
 * Validators. Each returns 1 when the text is valid, else 0 with
 *   ERR_BAD_PARAMETERS   the argument is NULL
 *   ERR_INVALID_NETNAME  the text is not valid
 * They read nothing but their argument. Numbers of dotted quads are decimal, one to three digits each.
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

/* "10.1.2.3/8" becomes "10.0.0.0/255.0.0.0". The length, 1 to 32 bits, is read in the base that its form says, as C
 * does: "/010" is 8 and "/0x18" is 24. */
TAVO_API int ErrTLIBSubnetToIpMask(char *szIn, char *szOut);

TAVO_END_DECLS

#endif
