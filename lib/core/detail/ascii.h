// Kinds of ASCII characters, whatever the locale.
#ifndef TAVO_CORE_DETAIL_ASCII_H
#define TAVO_CORE_DETAIL_ASCII_H

namespace tavo {

constexpr bool IsLower(char byte) noexcept
{
    return byte >= 'a' && byte <= 'z';
}

constexpr bool IsLetter(char byte) noexcept
{
    return IsLower(byte) || (byte >= 'A' && byte <= 'Z');
}

constexpr bool IsDigit(char byte) noexcept
{
    return byte >= '0' && byte <= '9';
}

}  // namespace tavo

#endif
