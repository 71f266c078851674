// Lets an interface wake the appliance, or no more.
#include "tavo_file.h"
#include "tavo_net.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/network_change.h"
#include "network/detail/wake_on_lan.h"

#include <optional>

namespace {

constexpr const char *kPanel = "/dev/ttyS1";

// Written as `echo "l"` does, but never made this process's terminal. 0 or a code. Other programs talk to the panel, too,
// and a line is one message.
int TellPanel()
{
    const tavo::LockHold line(TAVO_LOCK_TTYS1 | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5);
    if (!line)
        return ERR_LOCK_FAILED;
    const tavo::Fd panel = tavo::OpenFd(kPanel, O_WRONLY | O_NOFOLLOW);
    return panel && tavo::WriteAll(panel.Get(), "l\n") ? 0 : ERR_OP_FAILURE;
}

// 0 or a code. The card forgets when the power goes, so that the start-up scripts need the options, too.
int Store(const char *interface, const std::string &options)
{
    const tavo::LockHold lock(TAVO_LOCK_TAVOINFO | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5);
    if (!lock) {
        LogError("%s (%d) Failed to lock tavoinfo(%X)", TLIBErrGet());
        return ERR_LOCK_FAILED;
    }
    return TLIBFileSetKeyValue(tavo::kSettings, tavo::WakeOptionsKey(interface).c_str(), options.c_str(), nullptr) < 0
               ? TLIBErrGet()
               : ERR_SUCCESS;
}

// Whether the setting of the card differs; empty when the card does not answer or cannot do it.
std::optional<bool> HasToChange(const char *interface, uint32_t bits)
{
    const auto wake = tavo::GetWakeSettings(interface);
    if (!wake) {
        LogError("%s:%d Cannot get current wake-on-lan settings");
        return std::nullopt;
    }
    if (wake->enabled == bits)
        return false;
    if ((bits & ~wake->supported) != 0) {
        LogError("%s:%d Cannot set new wake-on-lan settings");
        return std::nullopt;
    }
    return true;
}

int TellCard(const char *interface, uint32_t bits)
{
    if (tavo::SetWakeOptions(interface, bits))
        return ERR_SUCCESS;
    LogError("%s:%d Cannot set new wake-on-lan settings");
    return ERR_OP_FAILURE;
}

// Stored first: the panel cannot be switched off again.
int Set(const char *interface, bool on, const std::string &options, uint32_t bits)
{
    const bool by_panel = tavo::IsWokenByPanel();
    if (by_panel && !on)
        return Fail(ERR_OP_UNREGISTERED);  // the controller knows no word for it
    const auto tells = by_panel ? std::optional(true) : HasToChange(interface, bits);
    if (!tells)
        return Fail(ERR_OP_FAILURE);
    tavo::Checkpoint before;
    before.AddSetting(tavo::kSettings, tavo::WakeOptionsKey(interface));
    before.Begin();
    int code = Store(interface, options);
    if (code == 0 && *tells)
        code = by_panel ? TellPanel() : TellCard(interface, bits);
    if (code == 0) {
        before.End();
        return 0;
    }
    before.PutBack();
    return Fail(code);
}

}  // namespace

extern "C" int TAVONetWolSet(const char *szInterface, int fEnable)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (!tavo::IsWakeOnLanSupported()) {
            LogError("%s:%d Wake-on-lan isn't supported.");
            return Fail(ERR_OP_UNREGISTERED);
        }
        const std::string options = fEnable ? tavo::ReadSetting(tavo::kSettings, "wol_enabled_options") : "d";
        const auto bits = tavo::ParseWakeOptions(options);
        if (!bits) {
            LogError("%s:%d Miss wake-on-lan enable options.");
            return Fail(options.empty() ? ERR_KEY_NOT_FOUND : ERR_FORMAT_ERROR);
        }
        return tavo::ChangeNetwork([&] { return Set(szInterface, fEnable != 0, options, *bits); }, TAVO_LOCK_TAVOINFO);
    });
}
