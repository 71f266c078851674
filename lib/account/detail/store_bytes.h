// Bytes of keys and values as callers pass and get them.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_BYTES_H
#define TAVO_ACCOUNT_DETAIL_STORE_BYTES_H

#include "core/detail/owner.h"

#include <cstring>
#include <string_view>

namespace tavo {

inline std::string_view BytesOf(const void *bytes, int count)
{
    return {static_cast<const char *>(bytes), static_cast<size_t>(count)};
}

// Returns a copy for the caller, followed by a NUL because most values are texts. Empty when memory is out.
inline HeapBlock<void> CopyBytes(std::string_view bytes)
{
    HeapBlock<void> copy(std::malloc(bytes.size() + 1));
    if (copy) {
        std::memcpy(copy.Get(), bytes.data(), bytes.size());
        static_cast<char *>(copy.Get())[bytes.size()] = 0;
    }
    return copy;
}

}  // namespace tavo

#endif
