// Checks whether two stretches of memory share a byte.
#ifndef TAVO_CORE_DETAIL_TEXT_OVERLAP_H
#define TAVO_CORE_DETAIL_TEXT_OVERLAP_H

#include <cstddef>
#include <cstdint>

namespace tavo {

inline bool Overlap(const void *a, size_t a_bytes, const void *b, size_t b_bytes)
{
    const auto a_begin = reinterpret_cast<uintptr_t>(a);
    const auto b_begin = reinterpret_cast<uintptr_t>(b);
    return a_begin < b_begin + b_bytes && b_begin < a_begin + a_bytes;
}

}  // namespace tavo

#endif
