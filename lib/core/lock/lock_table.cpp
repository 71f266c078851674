// The locks of this process.
#include "tavo_lock.h"

#include <cstddef>

static_assert(sizeof(void *) != 4 || (sizeof(TLIBLOCKFILE) == 20 && offsetof(TLIBLOCKFILE, szPath) == 4 &&
                                      offsetof(TLIBLOCKFILE, fLockBit) == 8 && offsetof(TLIBLOCKFILE, nRef) == 12 &&
                                      offsetof(TLIBLOCKFILE, nMode) == 16),
              "programs of the appliance read these records");

extern "C" {

// A request takes its locks in this order. Programs that ask for the same locks in several requests ask in this order,
// too.
// clang-format off
constinit TLIBLOCKFILE rgslckList[21] = {
    {nullptr, "/tmp/lock/lock_tavoinfo",  TAVO_LOCK_TAVOINFO,    0, 0},
    {nullptr, "/tmp/lock/lock_pw",        TAVO_LOCK_USER,        0, 0},
    {nullptr, "/tmp/lock/lock_gr",        TAVO_LOCK_GROUP,       0, 0},
    {nullptr, "/tmp/lock/lock_rc",        TAVO_LOCK_RC,          0, 0},
    {nullptr, "/tmp/lock/lock_host",      TAVO_LOCK_HOST,        0, 0},
    {nullptr, "/tmp/lock/lock_smb",       TAVO_LOCK_SMB,         0, 0},
    {nullptr, "/tmp/lock/lock_exports",   TAVO_LOCK_EXPORTS,     0, 0},
    {nullptr, "/tmp/lock/lock_nw",        TAVO_LOCK_NETWORK,     0, 0},
    {nullptr, "/tmp/lock/lock_apple",     TAVO_LOCK_APPLE,       0, 0},
    {nullptr, "/tmp/lock/lock_snmp",      TAVO_LOCK_SNMP,        0, 0},
    {nullptr, "/tmp/lock/lock_win",       TAVO_LOCK_WIN,         0, 0},
    {nullptr, "/tmp/lock/lock_tapebkp",   TAVO_LOCK_TAPE_BACKUP, 0, 0},
    {nullptr, "/tmp/lock/lock_connect",   TAVO_LOCK_CONNECT,     0, 0},
    {nullptr, "/tmp/lock/lock_usbidmap",  TAVO_LOCK_USB_ID_MAP,  0, 0},
    {nullptr, "/tmp/lock/lock_duseruid",  TAVO_LOCK_DOMAIN_UID,  0, 0},
    {nullptr, "/tmp/lock/lock_dusergid",  TAVO_LOCK_DOMAIN_GID,  0, 0},
    {nullptr, "/tmp/lock/lock_fstab",     TAVO_LOCK_FSTAB,       0, 0},
    {nullptr, "/tmp/lock/lock_hotswap",   TAVO_LOCK_HOTSWAP,     0, 0},
    {nullptr, "/tmp/lock/lock_space",     TAVO_LOCK_SPACE,       0, 0},
    {nullptr, "/tmp/lock/lock_ttys1",     TAVO_LOCK_TTYS1,       0, 0},
    {nullptr, "",                         0,                     0, 0},
};
// clang-format on
}
