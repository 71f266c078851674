// Where the search for a key begins and how it continues; inlined into both look-up and storing.
#ifndef TAVO_CORE_DETAIL_HASH_SLOT_H
#define TAVO_CORE_DETAIL_HASH_SLOT_H

#include "tavo_hash.h"

#include <bit>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace tavo {

static_assert(std::endian::native == std::endian::little, "the words of a key are read as they stand in memory");

template <class Word>
Word Load(const char *at)
{
    Word word;
    std::memcpy(&word, at, sizeof word);
    return word;
}

// The one to three bytes after the last whole word, as a word; 0 when there are none.
inline uint32_t LastWord(std::string_view key)
{
    const size_t left = key.size() % 4;
    const char *at = key.data() + (key.size() - left);
    if (key.size() >= 4)
        return static_cast<uint32_t>(uint64_t{Load<uint32_t>(at + left - 4)} >> (32 - 8 * left));
    uint32_t word = 0;
    for (size_t i = 0; i < left; ++i)
        word |= uint32_t{static_cast<unsigned char>(at[i])} << (8 * i);
    return word;
}

inline uint32_t WordSum(std::string_view key)
{
    uint32_t sum = LastWord(key);
    const char *at = key.data();
    size_t left = key.size();
    for (; left >= 8; left -= 8, at += 8) {
        const auto words = Load<uint64_t>(at);
        sum += static_cast<uint32_t>(words) + static_cast<uint32_t>(words >> 32);
    }
    return left >= 4 ? sum + Load<uint32_t>(at) : sum;
}

// Dividing by a constant compiles to a multiplication; every hash begins with one of these table sizes.
inline uint32_t Modulo(uint32_t sum, uint32_t slots)
{
    switch (slots) {
    case 31:
        return sum % 31;
    case 119:
        return sum % 119;
    case 471:
        return sum % 471;
    case 1879:
        return sum % 1879;
    case 7511:
        return sum % 7511;
    default:
        return sum % slots;
    }
}

// Returns the slot where the search for a key begins; -1 when the table has no slots.
inline int HomeSlot(std::string_view key, int slots) noexcept
{
    return slots > 0 ? static_cast<int>(Modulo(WordSum(key), static_cast<uint32_t>(slots))) : -1;
}

inline int NextSlot(const TLIBSZHASH *hash, int slot)
{
    return slot + 1 == hash->nSlot ? 0 : slot + 1;
}

}  // namespace tavo

#endif
