// The block of a string hash: how a pair is stored, how the block grows.
#include "core/detail/hash_table.h"

#include "core/detail/hash_slot.h"
#include "core/detail/owner.h"
#include "core/detail/text_overlap.h"

#include <climits>
#include <cstdlib>
#include <cstring>

namespace tavo {
namespace {

char *StoreText(TLIBSZHASH *hash, std::string_view text)
{
    char *stored = hash->pszNextStr;
    std::memmove(stored, text.data(), text.size());
    stored[text.size()] = '\0';
    hash->pszNextStr += text.size() + 1;
    hash->nStrFree -= static_cast<int32_t>(text.size() + 1);
    return stored;
}

void StoreNewPair(TLIBSZHASH *hash, int slot, std::string_view key, std::string_view value)
{
    hash->slots[slot].pszKey = StoreText(hash, key);
    hash->slots[slot].pszValue = StoreText(hash, value);
    ++hash->nPair;
}

// True when less than a quarter of the slots is free. The ratio is a quotient of single-precision numbers, which
// differs from the exact one only in tables beyond their 24 bits. A division for every pair would be noticeable.
bool IsCrowded(const TLIBSZHASH *hash)
{
    const int free_slots = hash->nSlot - hash->nPair;
    if (hash->nSlot < 1 << 24)
        return 4 * free_slots < hash->nSlot;
    return static_cast<float>(free_slots) / static_cast<float>(hash->nSlot) < 0.25F;
}

// Finds the place of a key that the hash does not hold, in a table without removed pairs.
int FirstFreeSlot(const TLIBSZHASH *hash, std::string_view key)
{
    const int home = HomeSlot(key, hash->nSlot);
    int slot = home;
    while (slot >= 0 && IsPair(hash->slots[slot])) {
        slot = NextSlot(hash, slot);
        if (slot == home)
            return -1;
    }
    return slot;
}

}  // namespace

char *StringArea(TLIBSZHASH *hash) noexcept
{
    return reinterpret_cast<char *>(hash->slots + hash->nSlot);
}

TLIBSZHASH *NewHash(int64_t slots, int64_t string_bytes) noexcept
{
    if (slots < 0 || slots > INT_MAX || string_bytes < 0 || string_bytes > INT_MAX)
        return nullptr;
    const uint64_t bytes = sizeof(TLIBSZHASH) + static_cast<uint64_t>(slots) * sizeof(TLIBSZHASHSLOT) +
                           static_cast<uint64_t>(string_bytes);
    if (bytes > PTRDIFF_MAX)
        return nullptr;
    auto *hash = static_cast<TLIBSZHASH *>(std::calloc(1, static_cast<size_t>(bytes)));
    if (!hash)
        return nullptr;
    hash->nStrSize = static_cast<int32_t>(string_bytes);
    hash->nStrFree = hash->nStrSize;
    hash->nSlot = static_cast<int32_t>(slots);
    hash->pszNextStr = StringArea(hash);
    return hash;
}

TLIBSZHASH *CopyToNewHash(const TLIBSZHASH *hash, int64_t slots, int64_t string_bytes) noexcept
{
    if (slots < hash->nPair)
        return nullptr;
    HashOwner copy(NewHash(slots, string_bytes));
    if (!copy)
        return nullptr;
    for (int slot = 0; slot < hash->nSlot; ++slot) {
        if (!IsPair(hash->slots[slot]))
            continue;
        const std::string_view key(hash->slots[slot].pszKey);
        const std::string_view value(hash->slots[slot].pszValue);
        // The keys are distinct and nothing has been removed yet, so no key needs comparing.
        const int free_slot = FirstFreeSlot(copy.Get(), key);
        if (free_slot < 0 || PairBytes(key, value) > copy->nStrFree)
            return nullptr;
        StoreNewPair(copy.Get(), free_slot, key, value);
    }
    return copy.Release();
}

bool MakeHashRoom(TLIBSZHASH **hash, int64_t bytes, HashOwner &left) noexcept
{
    const TLIBSZHASH *old = *hash;
    const int free_slots = old->nSlot - old->nPair;
    const int64_t slots = IsCrowded(old) ? int64_t{4} * old->nSlot - 5 : old->nSlot;
    int64_t string_bytes = old->nStrSize;
    if (old->nStrFree <= bytes) {
        const int64_t average = old->nPair > 0 ? old->nStrSize / old->nPair : bytes;
        string_bytes += average * free_slots + bytes;
    } else if (slots == old->nSlot) {
        return true;
    }
    TLIBSZHASH *grown = CopyToNewHash(old, slots, string_bytes);
    if (!grown)
        return false;
    left.Reset(*hash);
    *hash = grown;
    return true;
}

bool StorePair(TLIBSZHASH *hash, int slot, std::string_view key, std::string_view value) noexcept
{
    HeapBlock<char> kept;
    // The new key may overwrite the text of a removed pair.
    if (Overlap(hash->pszNextStr, key.size() + 1, value.data(), value.size() + 1)) {
        kept.Reset(static_cast<char *>(std::malloc(value.size() + 1)));
        if (!kept)
            return false;
        std::memcpy(kept.Get(), value.data(), value.size() + 1);
        value = {kept.Get(), value.size()};
    }
    StoreNewPair(hash, slot, key, value);
    return true;
}

int InsertNewPair(TLIBSZHASH **hash, int slot, std::string_view key, std::string_view value) noexcept
{
    HashOwner left;
    if ((*hash)->nSlot == 0 || !MakeHashRoom(hash, PairBytes(key, value), left))
        return -1;
    if (left)
        slot = FirstFreeSlot(*hash, key);
    if (slot < 0 || !StorePair(*hash, slot, key, value))
        return -1;
    return slot;
}

int UpdateValue(TLIBSZHASH **hash, int slot, std::string_view key, std::string_view value) noexcept
{
    char *old_value = (*hash)->slots[slot].pszValue;
    if (value.size() <= std::strlen(old_value)) {
        std::memmove(old_value, value.data(), value.size() + 1);
        return slot;
    }
    HashOwner left;
    if (!MakeHashRoom(hash, static_cast<int64_t>(value.size()) + 1, left))
        return -1;
    if (left)
        slot = FindPair(*hash, key);
    (*hash)->slots[slot].pszValue = StoreText(*hash, value);
    return slot;
}

}  // namespace tavo
