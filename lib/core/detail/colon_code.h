// The four sequences of the colon encoding.
#ifndef TAVO_CORE_DETAIL_COLON_CODE_H
#define TAVO_CORE_DETAIL_COLON_CODE_H

#include <array>
#include <string_view>

namespace tavo {

struct ColonCode {
    char plain;
    std::string_view encoded;
};

inline constexpr std::array<ColonCode, 4> kColonCodes = {{
    {'%', "%25"},
    {':', "%3A"},
    {'\n', "%0A"},
    {'\r', "%0D"},
}};

// The sequence that the text begins with, or NULL.
constexpr const ColonCode *CodeAt(std::string_view text)
{
    for (const ColonCode &code : kColonCodes) {
        if (text.starts_with(code.encoded))
            return &code;
    }
    return nullptr;
}

}  // namespace tavo

#endif
