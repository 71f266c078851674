// Texts that are overwritten before their memory goes back: passwords, and what they are hashed from.
#ifndef TAVO_ACCOUNT_DETAIL_SECRET_TEXT_H
#define TAVO_ACCOUNT_DETAIL_SECRET_TEXT_H

#include <vector>

#include <string.h>

namespace tavo {

template <class T>
struct WipingAllocator : std::allocator<T> {
    template <class Other>
    struct rebind {
        using other = WipingAllocator<Other>;
    };
    WipingAllocator() = default;
    template <class Other>
    WipingAllocator(const WipingAllocator<Other> &) noexcept
    {
    }
    void deallocate(T *block, size_t count) noexcept
    {
        ::explicit_bzero(static_cast<void *>(block), count * sizeof(T));
        std::allocator<T>::deallocate(block, count);
    }
};

// Not strings: short ones of those stand outside of any block.
using SecretBytes = std::vector<char, WipingAllocator<char>>;
using SecretUtf16 = std::vector<char16_t, WipingAllocator<char16_t>>;

// A value on the stack that is overwritten when its scope ends.
template <class T>
struct Wiped : T {
    Wiped() : T{} {}
    ~Wiped() { ::explicit_bzero(static_cast<void *>(static_cast<T *>(this)), sizeof(T)); }
    Wiped(const Wiped &) = delete;
    Wiped &operator=(const Wiped &) = delete;
};

}  // namespace tavo

#endif
