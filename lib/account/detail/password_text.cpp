// Passwords in the encodings that the Samba hashes are made of.
#include "account/detail/password_text.h"

#include "tavo_error.h"

#include "core/detail/extras.h"

#include <new>

namespace tavo {
namespace {

constexpr int32_t kReplacement = 0xFFFD;

// The code of a conversion that gave this length.
Code LengthCode(int32_t length)
{
    if (length == kNoMemory)
        throw std::bad_alloc();
    return length < 0 ? ERR_OP_FAILURE : 0;
}

Code Utf16(const Extras &extras, std::string_view utf8, SecretUtf16 &units)
{
    units.resize(utf8.size() + 1);  // no character has more units than it has bytes
    const int32_t length = extras.to_utf16(utf8.data(), static_cast<int32_t>(utf8.size()), kReplacement, units.data(),
                                           static_cast<int32_t>(units.size()));
    const Code code = LengthCode(length);
    units.resize(code == 0 ? static_cast<size_t>(length) : 0);
    return code;
}

bool IsHighSurrogate(char16_t unit)
{
    return (unit & 0xFC00) == 0xD800;
}

}  // namespace

Code UpperCodePage850(std::string_view utf8, SecretBytes &bytes)
{
    const Extras *extras = LoadExtras();
    if (!extras)
        return ERR_OP_FAILURE;
    SecretUtf16 units;
    if (const Code code = Utf16(*extras, utf8, units))
        return code;
    SecretUtf16 upper;
    upper.reserve(units.size());
    for (size_t at = 0; at < units.size(); ++at) {
        // The code page has nothing that takes two units.
        const int32_t larger = IsHighSurrogate(units[at]) ? (++at, kReplacement) : extras->upper_one(units[at]);
        upper.push_back(static_cast<char16_t>(larger > 0xFFFF ? kReplacement : larger));
    }
    bytes.resize(2 * upper.size() + 1);
    const int32_t length = extras->to_code_page_850(upper.data(), static_cast<int32_t>(upper.size()), bytes.data(),
                                                    static_cast<int32_t>(bytes.size()));
    const Code code = LengthCode(length);
    bytes.resize(code == 0 ? static_cast<size_t>(length) : 0);
    return code;
}

Code Utf16LowFirst(std::string_view utf8, SecretBytes &bytes)
{
    const Extras *extras = LoadExtras();
    if (!extras)
        return ERR_OP_FAILURE;
    SecretUtf16 units;
    if (const Code code = Utf16(*extras, utf8, units))
        return code;
    bytes.clear();
    bytes.reserve(2 * units.size());
    for (const char16_t unit : units) {
        bytes.push_back(static_cast<char>(unit & 0xFF));
        bytes.push_back(static_cast<char>(unit >> 8));
    }
    return 0;
}

}  // namespace tavo
