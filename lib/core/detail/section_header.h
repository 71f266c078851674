// The header line of a section: its name in square brackets.
#ifndef TAVO_CORE_DETAIL_SECTION_HEADER_H
#define TAVO_CORE_DETAIL_SECTION_HEADER_H

#include "core/detail/key_value_line.h"

#include <string_view>

namespace tavo {

constexpr bool IsSectionHeader(std::string_view line)
{
    const size_t last = line.find_last_not_of(kWhiteSpace);
    return line.starts_with('[') && line[last] == ']';
}

// White space inside the brackets and text after them are not allowed.
constexpr bool HeadsSection(std::string_view line, std::string_view name)
{
    const size_t closing = name.size() + 1;
    return line.size() > closing && line[0] == '[' && std::string_view(&line[1], name.size()) == name &&
           line[closing] == ']' && line.find_first_not_of(kWhiteSpace, closing + 1) == line.npos;
}

// Returns whether a header with this name can be found again.
constexpr bool IsWritableSectionName(std::string_view name)
{
    return name.find_first_of("]\n\r") == name.npos;
}

}  // namespace tavo

#endif
