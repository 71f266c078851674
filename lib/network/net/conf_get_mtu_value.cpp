// Reads the stored MTU of an interface.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/fault.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "network/detail/interface_name.h"
#include "network/detail/mtu_setting.h"
#include "network/detail/net_buffer.h"

#include <cstring>

namespace {

// An interface without a stored MTU has the default, which is not a failure.
template <size_t Size>
bool Read(const char *interface, char (&value)[Size])
{
    const tavo::KeepFault keep;
    return TLIBFileGetKeyValue(tavo::kSettings, tavo::MtuKey(interface).text, value, Size, 0) > 1;
}

}  // namespace

extern "C" int TAVOConfGetMTUValue(const char *szInterface, char *szMtu, int cbMtu)
{
    if (!szInterface || !szMtu || cbMtu <= 0)
        return Fail(ERR_BAD_PARAMETERS);
    if (!tavo::IsInterfaceName(szInterface)) {
        LogError("%s:%d interface name is too long");
        return Fail(ERR_BAD_PARAMETERS);
    }
    char value[16] = "";
    if (!Read(szInterface, value))
        std::strcpy(value, tavo::kMtuDefault);
    return tavo::ToBuffer(value, szMtu, cbMtu) ? 0 : Fail(ERR_NOT_ENOUGH_MEMORY);
}
