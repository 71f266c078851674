// Text into the fixed fields of records.
#ifndef TAVO_STORAGE_DETAIL_BOUNDED_TEXT_H
#define TAVO_STORAGE_DETAIL_BOUNDED_TEXT_H

#include <cstddef>
#include <string_view>

namespace tavo {

template <size_t Size>
void CopyBounded(char (&to)[Size], std::string_view text)
{
    to[text.copy(to, Size - 1)] = 0;
}

}  // namespace tavo

#endif
