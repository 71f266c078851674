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

// No white space may stand inside the brackets, and nothing else behind them.
constexpr bool HeadsSection(std::string_view line, std::string_view name)
{
    return line.starts_with('[') && line.substr(1).starts_with(name) && line.substr(1 + name.size()).starts_with(']') &&
           line.find_first_not_of(kWhiteSpace, name.size() + 2) == line.npos;
}

// Whether a header with this name is found again.
constexpr bool IsWritableSectionName(std::string_view name)
{
    return name.find_first_of("]\n\r") == name.npos;
}

}  // namespace tavo

#endif
