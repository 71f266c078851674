// The names of network interfaces: they go into paths and commands, so they are looked at before anything else.
#ifndef TAVO_NETWORK_DETAIL_INTERFACE_NAME_H
#define TAVO_NETWORK_DETAIL_INTERFACE_NAME_H

#include "network/detail/name_text.h"

namespace tavo {

// 1 to 15 letters, digits and "_.:-", as the kernel takes them; not "." or "..", and not like an option of a command.
constexpr bool IsInterfaceName(std::string_view name) noexcept
{
    if (name.empty() || name.size() > 15 || name[0] == '-' || name == "." || name == "..")
        return false;
    for (const char byte : name) {
        if (!IsLetter(byte) && !IsDigit(byte) && std::string_view("_.:-").find(byte) == std::string_view::npos)
            return false;
    }
    return true;
}

}  // namespace tavo

#endif
