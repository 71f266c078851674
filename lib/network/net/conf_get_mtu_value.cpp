// Tells the stored MTU of an interface.
#include "tavo_net.h"

#include "tavo_file.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/mtu_setting.h"
#include "network/detail/net_buffer.h"

extern "C" int TAVOConfGetMTUValue(const char *szInterface, char *szMtu, int cbMtu)
{
    if (!szInterface || !szMtu || cbMtu <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsInterfaceName(szInterface)) {
        LogError("%s:%d interface name is too long");
        return Fail(ERR_BAD_PARAMETERS);
    }
    char value[16] = "";
    const int length =
        TLIBFileGetKeyValue("/etc/tavoinfo.conf", tavo::MtuKey(szInterface).text, value, sizeof value, 0);
    if (!tavo::ToBuffer(length > 1 ? value : tavo::kMtuDefault, szMtu, cbMtu))
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    return 0;
}
