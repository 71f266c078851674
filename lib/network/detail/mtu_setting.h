// The stored MTU of an interface: the key "NAME_mtu" of the system settings.
#ifndef TAVO_NETWORK_DETAIL_MTU_SETTING_H
#define TAVO_NETWORK_DETAIL_MTU_SETTING_H

#include <cstdio>

namespace tavo {

inline constexpr const char *kMtuDefault = "1500";
inline constexpr int kMtuLeast = 68;  // the minimum of IPv4
inline constexpr int kMtuMost = 65535;

constexpr bool IsMtu(int mtu) noexcept
{
    return mtu >= kMtuLeast && mtu <= kMtuMost;
}

struct MtuKey {
    char text[32];

    explicit MtuKey(const char *interface) noexcept { std::snprintf(text, sizeof text, "%s_mtu", interface); }
};

}  // namespace tavo

#endif
