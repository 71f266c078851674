// The characters of a salt.
#ifndef TAVO_ACCOUNT_DETAIL_SALT_CHAR_H
#define TAVO_ACCOUNT_DETAIL_SALT_CHAR_H

#include <cstdint>

namespace tavo {

// The number's absolute value modulo 64, as one of 64 characters.
constexpr char SaltChar(int32_t number) noexcept
{
    const uint32_t magnitude = number < 0 ? 0u - static_cast<uint32_t>(number) : static_cast<uint32_t>(number);
    return "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz./"[magnitude % 64];
}

static_assert(SaltChar(INT32_MIN) == '0' && SaltChar(-63) == '/' && SaltChar(62) == '.');

}  // namespace tavo

#endif
