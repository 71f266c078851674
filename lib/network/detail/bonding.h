// Reads a bond from the kernel's bonding driver, and the options that make one.
#ifndef TAVO_NETWORK_DETAIL_BONDING_H
#define TAVO_NETWORK_DETAIL_BONDING_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// The selector of a link-aggregation record, in the order in which the web pages offer the modes.
enum class BondMode : int { none = 0, lacp = 1, adaptive = 2, backup = 3 };

// The text of /sys/class/net/BOND/bonding/mode; empty for a mode that the appliance does not offer.
std::optional<BondMode> ParseBondMode(std::string_view text) noexcept;

// The value of BONDING_OPTS, with its quotation marks; "" for BondMode::none.
std::string_view BondOptions(BondMode mode) noexcept;

// The partner's hardware address in /proc/net/bonding/BOND; empty when it names none.
std::string ParsePartnerMac(std::string_view text);

}  // namespace tavo

#endif
