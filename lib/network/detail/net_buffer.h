// Hands a text to a caller's buffer, whole or not at all.
#ifndef TAVO_NETWORK_DETAIL_NET_BUFFER_H
#define TAVO_NETWORK_DETAIL_NET_BUFFER_H

#include <cstring>
#include <string_view>

namespace tavo {

inline bool ToBuffer(std::string_view text, char *buffer, int size) noexcept
{
    if (size <= 0 || text.size() >= static_cast<size_t>(size))
        return false;
    std::memcpy(buffer, text.data(), text.size());
    buffer[text.size()] = 0;
    return true;
}

}  // namespace tavo

#endif
