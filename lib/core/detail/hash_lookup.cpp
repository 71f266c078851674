// Looks up a key in a string hash's table.
#include "core/detail/hash_slot.h"
#include "core/detail/hash_table.h"

namespace tavo {
namespace {

const char *StringEnd(const TLIBSZHASH *hash)
{
    return reinterpret_cast<const char *>(hash->slots + hash->nSlot) + hash->nStrSize;
}

// Compares `bytes` readable bytes. Keys are short: calling memcmp would cost more than the comparison.
bool SameBytes(const char *a, const char *b, size_t bytes)
{
    if (bytes < 8) {
        while (bytes > 0 && a[bytes - 1] == b[bytes - 1])
            --bytes;
        return bytes == 0;
    }
    for (size_t i = 0; i + 8 <= bytes; i += 8) {
        if (Load<uint64_t>(a + i) != Load<uint64_t>(b + i))
            return false;
    }
    return Load<uint64_t>(a + bytes - 8) == Load<uint64_t>(b + bytes - 8);
}

// A key is compared including its NUL. The bytes after a shorter key are in the block too, except at its very end.
bool Holds(const TLIBSZHASHSLOT &slot, std::string_view key, const char *end)
{
    const size_t bytes = key.size() + 1;
    if (static_cast<size_t>(end - slot.pszKey) < bytes)
        return false;
    return SameBytes(slot.pszKey, key.data(), bytes);
}

}  // namespace

int FindPair(const TLIBSZHASH *hash, std::string_view key) noexcept
{
    const int home = HomeSlot(key, hash->nSlot);
    if (home < 0)
        return -1;
    const char *end = StringEnd(hash);
    int slot = home;
    do {
        const TLIBSZHASHSLOT &at = hash->slots[slot];
        if (IsPair(at)) {
            if (Holds(at, key, end))
                return slot;
        } else if (IsNeverUsed(at)) {
            return -1;
        }
        slot = NextSlot(hash, slot);
    } while (slot != home);
    return -1;
}

Place FindPlace(const TLIBSZHASH *hash, std::string_view key) noexcept
{
    const int home = HomeSlot(key, hash->nSlot);
    if (home < 0)
        return {};
    const char *end = StringEnd(hash);
    const TLIBSZHASHSLOT &first = hash->slots[home];
    if (IsNeverUsed(first) || (IsPair(first) && Holds(first, key, end)))
        return {home, -1};
    Place place;
    if (!IsPair(first))
        place.spare = home;
    for (int slot = NextSlot(hash, home); slot != home; slot = NextSlot(hash, slot)) {
        const TLIBSZHASHSLOT &at = hash->slots[slot];
        if (IsPair(at)) {
            if (Holds(at, key, end))
                return {slot, -1};
        } else if (!IsNeverUsed(at)) {
            if (place.usual < 0)
                place.usual = slot;
        } else {
            if (place.spare < 0)
                place.spare = slot;
            break;
        }
    }
    return place;
}

}  // namespace tavo
