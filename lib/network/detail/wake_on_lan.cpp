// Wake-on-LAN: the limits of the model and its settings, and the configuration of a card.
#include "network/detail/wake_on_lan.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/owner.h"
#include "network/detail/interface_file.h"

#include <cstring>

#include <linux/ethtool.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace tavo {
namespace {

struct WakeLetter {
    char letter;
    uint32_t bit;
};

// clang-format off
constexpr WakeLetter kLetters[] = {
    {'p', WAKE_PHY},
    {'u', WAKE_UCAST},
    {'m', WAKE_MCAST},
    {'b', WAKE_BCAST},
    {'a', WAKE_ARP},
    {'g', WAKE_MAGIC},
    {'s', WAKE_MAGICSECURE},
    {'d', 0},
};
// clang-format on

bool Ask(const char *interface, ethtool_wolinfo &wake)
{
    const Fd socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (!socket)
        return false;
    ifreq ask{};
    std::strncpy(ask.ifr_name, interface, IFNAMSIZ - 1);
    ask.ifr_data = reinterpret_cast<char *>(&wake);
    return ::ioctl(socket.Get(), SIOCETHTOOL, &ask) == 0;
}

}  // namespace

bool IsWakeOnLanSupported()
{
    return ReadSetting(kSettings, "support_wol") == "yes";
}

bool IsWokenByPanel()
{
    return ReadSetting(kFactorySettings, "wol_by_panel") == "yes";
}

std::string WakeOptionsKey(std::string_view interface)
{
    return std::string(interface).append("_wol_options");
}

std::optional<uint32_t> ParseWakeOptions(std::string_view letters) noexcept
{
    if (letters.empty())
        return std::nullopt;
    uint32_t bits = 0;
    for (const char letter : letters) {
        const WakeLetter *found = nullptr;
        for (const WakeLetter &row : kLetters) {
            if (row.letter == letter)
                found = &row;
        }
        if (!found)
            return std::nullopt;
        bits |= found->bit;
    }
    return bits;
}

std::optional<WakeSettings> GetWakeSettings(const char *interface)
{
    ethtool_wolinfo wake{};
    wake.cmd = ETHTOOL_GWOL;
    if (!Ask(interface, wake))
        return std::nullopt;
    return WakeSettings{wake.supported, wake.wolopts};
}

bool SetWakeOptions(const char *interface, uint32_t options)
{
    ethtool_wolinfo wake{};
    wake.cmd = ETHTOOL_SWOL;
    wake.wolopts = options;
    return Ask(interface, wake);
}

}  // namespace tavo
