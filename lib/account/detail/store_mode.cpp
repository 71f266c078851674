// The permissions of the stores.
#include "account/detail/store_mode.h"

#include "account/detail/setting_switch.h"
#include "core/detail/keep_fault.h"
#include "tavo_file.h"

#include <charconv>
#include <cstring>

namespace tavo {

mode_t StoreMode()
{
    constexpr mode_t usual = 0666;
    const KeepFault keep;
    char text[8];
    if (TLIBFileGetKeyValue(kFactorySettings, "account_store_mode", text, sizeof text, 0) <= 0)
        return usual;
    unsigned mode = 0;
    const char *end = text + std::strlen(text);
    const auto [stop, error] = std::from_chars(text, end, mode, 8);
    return error == std::errc() && stop == end && (mode & ~0666u) == 0 && (mode & 0600u) == 0600u ? mode : usual;
}

}  // namespace tavo
