// The block of a string hash: where a key is, how a pair is stored, how the block grows.
#ifndef TAVO_CORE_DETAIL_HASH_TABLE_H
#define TAVO_CORE_DETAIL_HASH_TABLE_H

#include "tavo_hash.h"

#include "core/detail/list_owner.h"

#include <cstdint>
#include <string_view>

namespace tavo {

inline bool IsPair(const TLIBSZHASHSLOT &slot)
{
    return slot.pszKey != nullptr;
}

inline bool IsNeverUsed(const TLIBSZHASHSLOT &slot)
{
    return !slot.pszKey && !slot.pszValue;
}

inline int64_t PairBytes(std::string_view key, std::string_view value)
{
    return static_cast<int64_t>(key.size()) + static_cast<int64_t>(value.size()) + 2;
}

char *StringArea(TLIBSZHASH *hash) noexcept;

// Returns the slot that holds the key, or -1.
int FindPair(const TLIBSZHASH *hash, std::string_view key) noexcept;

// Where a key goes. `usual` is the slot that holds the key, or else the one that TLIBISetLookDict chooses. If that
// finds none, `usual` is -1 and `spare` is the first free slot from the home slot on. Both are -1 in a full table.
struct Place {
    int usual = -1;
    int spare = -1;

    int Slot() const { return usual >= 0 ? usual : spare; }
};

Place FindPlace(const TLIBSZHASH *hash, std::string_view key) noexcept;

// Creates an empty hash; NULL when a number is out of range or memory runs out.
TLIBSZHASH *NewHash(int64_t slots, int64_t string_bytes) noexcept;

// Copies the pairs to a new block; NULL when memory runs out or they do not fit.
TLIBSZHASH *CopyToNewHash(const TLIBSZHASH *hash, int64_t slots, int64_t string_bytes) noexcept;

// Grows the hash by its rule for one more text of `bytes` bytes. Moves the old block to `left` when the hash got a new
// one, because the caller's text may be in it. False, and nothing changed, when the hash cannot grow.
bool MakeHashRoom(TLIBSZHASH **hash, int64_t bytes, HashOwner &left) noexcept;

// Stores the pair of a new key in a free slot; there must be room. False when memory runs out, which can only happen
// for a value that the pair would overwrite.
bool StorePair(TLIBSZHASH *hash, int slot, std::string_view key, std::string_view value) noexcept;

// Adds the pair of a new key. It goes to `slot` (-1: the table is full) unless the hash grows. Returns the slot, or -1.
int InsertNewPair(TLIBSZHASH **hash, int slot, std::string_view key, std::string_view value) noexcept;

// Replaces the value of the key in `slot`. Returns the slot, which changes when the hash grows, or -1.
int UpdateValue(TLIBSZHASH **hash, int slot, std::string_view key, std::string_view value) noexcept;

}  // namespace tavo

#endif
