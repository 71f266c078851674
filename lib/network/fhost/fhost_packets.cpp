// The discovery packets as they go over the wire; the daemon and other programs use the same bytes.
#include "tavo_fhost.h"

#define HEADER 0x12, 0x34, 0x56, 0x78, 'T', 'A', 'V', 'O'

// After the header: a type byte, a length byte, that many bytes.
#define PROTOCOL       0x01, 4, 0x01, 0x00, 0x00, 0x00
#define VARIANT(which) 0xA4, 4, 0x00, 0x00, 0x02, which

extern "C" {

constinit const uint8_t stFHOSTHeader[8] = {HEADER};
constinit const uint8_t stFHOSTBroadCast[10] = {HEADER, 0x00, 0x00};
constinit const uint8_t stFHOSTBroadCastV11[20] = {HEADER, PROTOCOL, VARIANT(0x00)};
constinit const uint8_t stFHOSTBroadCastVDS20[20] = {HEADER, PROTOCOL, VARIANT(0x01)};

constinit const int32_t FHOSTHeaderSize = sizeof stFHOSTHeader;
constinit const int32_t FHOSTBroadCastSize = sizeof stFHOSTBroadCast;
constinit const int32_t FHOSTBroadCastSizeV11 = sizeof stFHOSTBroadCastV11;
constinit const int32_t FHOSTBroadCastSizeVDS20 = sizeof stFHOSTBroadCastVDS20;
}
