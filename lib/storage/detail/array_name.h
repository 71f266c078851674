// Names of arrays: which text is one, and where the kernel shows it.
#ifndef TAVO_STORAGE_DETAIL_ARRAY_NAME_H
#define TAVO_STORAGE_DETAIL_ARRAY_NAME_H

#include "core/detail/strict_number.h"
#include "storage/detail/device_name.h"

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr std::string_view kArray = "/dev/md";

// A decimal number in the name of an array: no sign, no leading zeros, within a minor number's 20 bits.
inline std::optional<int> ArrayNumberText(std::string_view text)
{
    if (text.empty() || text.size() > 7 || text[0] < '0' || text[0] > '9' || (text.size() > 1 && text[0] == '0'))
        return std::nullopt;
    const std::optional<int> number = StrictNumber<int>(text);
    return number && *number < 1 << 20 ? number : std::nullopt;
}

// The number of "/dev/md2"; empty for all other text.
inline std::optional<int> ArrayNumber(std::string_view path)
{
    return path.starts_with(kArray) ? ArrayNumberText(path.substr(kArray.size())) : std::nullopt;
}

inline bool IsArrayPath(const char *path)
{
    return path && ArrayNumber(path).has_value();
}

inline bool IsMemberPath(const char *path)
{
    return path && IsDevicePath(path);
}

// "/sys/block/md2/" and the leaf.
inline std::string ArrayFile(int number, std::string_view leaf)
{
    return "/sys/block/md" + std::to_string(number) + "/" + std::string(leaf);
}

}  // namespace tavo

#endif
