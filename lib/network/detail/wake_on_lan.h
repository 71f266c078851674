// Wake-on-LAN: the limits of the model and its settings, and the configuration of a card.
#ifndef TAVO_NETWORK_DETAIL_WAKE_ON_LAN_H
#define TAVO_NETWORK_DETAIL_WAKE_ON_LAN_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

bool IsWakeOnLanSupported();

// Returns whether the controller of the front panel, which has power when the appliance is off, does the waking on this
// model.
bool IsWokenByPanel();

// The settings key of an interface: "eth0_wol_options".
std::string WakeOptionsKey(std::string_view interface);

// The card's bits for letters such as "g" or "ug"; "d" means no bits. Empty for a text without letters or with any
// other letter.
std::optional<uint32_t> ParseWakeOptions(std::string_view letters) noexcept;

struct WakeSettings {
    uint32_t supported;
    uint32_t enabled;
};

// Asked of the card itself. Empty, or false, with errno.
std::optional<WakeSettings> GetWakeSettings(const char *interface);
bool SetWakeOptions(const char *interface, uint32_t options);

}  // namespace tavo

#endif
