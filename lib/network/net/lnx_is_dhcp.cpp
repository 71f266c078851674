// Checks whether an interface gets its address from DHCP.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/network_change.h"

#include <cerrno>
#include <cstring>

#include <sys/stat.h>

namespace {

// One that cannot be read just now may well say dhcp, and stays.
bool LacksMode(const std::string &file, int code)
{
    struct stat st;
    return code == ERR_KEY_NOT_FOUND || code == ERR_NOT_ENOUGH_MEMORY ||  // or its value is longer than any mode
           (code == ERR_OPEN_FAILED && ::stat(file.c_str(), &st) != 0 && errno == ENOENT);
}

bool IsDhcp(const char *interface)
{
    const tavo::LockHold lock(tavo::kNetworkShared, tavo::kNetworkSeconds);
    if (!lock) {
        LogError("%s(%d) ErrTLIBFileLock failed.");
        return false;
    }
    char protocol[16];
    const std::string file = tavo::InterfaceFile(interface);
    if (TLIBFileGetKeyValue(file.c_str(), "BOOTPROTO", protocol, sizeof protocol, 0) > 0)
        return std::strcmp(protocol, "dhcp") == 0;
    LogError("%s(%d) Get BOOTPROTO failed.(%X)", TLIBErrGet());
    // The start-up script needs the key: an interface without one stays down.
    if (LacksMode(file, TLIBErrGet()) && TLIBFileSetKeyValue(file.c_str(), "BOOTPROTO", "static", nullptr) < 0)
        LogError("%s(%d) TLIBFileSetKeyValue(%s, BOOTPROTO, static) failed.(%X)", file, TLIBErrGet());
    return false;
}

}  // namespace

extern "C" int BlTAVOLnxIsDHCP(const char *szInterface)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return FailZero(ERR_BAD_PARAMETERS);
    return Guard([&]() -> bool {
        const bool answer = IsDhcp(szInterface);
        tavo::KeepHostsTrueAfterwards();  // a client whose hook met the lock left it to us
        return answer;
    });
}
