// Sets the MTU of an interface in the kernel and stores it for the next start.
#include "tavo_net.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/guard.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_name.h"
#include "network/detail/mtu_setting.h"
#include "network/detail/network_change.h"

namespace {

// One that the card refuses is not stored: the next start would fail on it, too.
int SetBoth(const char *interface, int mtu)
{
    tavo::Checkpoint before;
    before.AddMtu(interface);
    before.AddSetting(tavo::kSettings, tavo::MtuKey(interface).text);
    before.Begin();
    // Also when the command failed: it may have been killed when its work was done.
    if (TAVONetSetMTUEth(interface, mtu) != 0 || TAVOConfSetMTUValue(interface, mtu) != 0) {
        before.PutBack();
        return -1;
    }
    before.End();
    return 0;
}

}  // namespace

extern "C" int TAVONetSetMTUValue(const char *szInterface, int mtu)
{
    if (!tavo::IsMtu(mtu) || !szInterface || !tavo::IsInterfaceName(szInterface))
        return TAVOConfSetMTUValue(szInterface, mtu);  // refuses, and logs why
    return Guard([&] { return tavo::ChangeNetwork([&] { return SetBoth(szInterface, mtu); }, TAVO_LOCK_TAVOINFO); });
}
