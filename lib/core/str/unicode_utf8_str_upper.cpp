// Copies a UTF-8 text in upper case.
#include "tavo_str.h"

#include "core/detail/extras.h"
#include "core/detail/guard.h"

#include <algorithm>
#include <climits>
#include <cstring>
#include <new>
#include <optional>
#include <string>
#include <string_view>

namespace {

bool IsAscii(std::string_view text)
{
    return std::all_of(text.begin(), text.end(), [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
}

std::string UpperAscii(std::string_view text)
{
    std::string upper(text);
    for (char &byte : upper)
        byte = byte >= 'a' && byte <= 'z' ? static_cast<char>(byte - 'a' + 'A') : byte;
    return upper;
}

// Returns the result of `convert` on a text, in as many units as it takes; nothing when it fails.
template <class Text, class Convert>
std::optional<Text> Converted(size_t likely, Convert convert)
{
    Text converted(likely, 0);
    for (;;) {
        const int32_t length = convert(converted.data(), static_cast<int32_t>(converted.size()));
        if (length == tavo::kNoMemory)
            throw std::bad_alloc();
        if (length < 0 || length == INT_MAX)
            return std::nullopt;
        const bool fits = static_cast<size_t>(length) <= converted.size();
        converted.resize(static_cast<size_t>(length));
        if (fits)
            return converted;
    }
}

// Returns nothing when the text is not UTF-8, or the tables cannot be loaded.
std::optional<std::string> Upper(std::string_view text)
{
    if (IsAscii(text))
        return UpperAscii(text);
    const tavo::Extras *extras = tavo::LoadExtras();
    if (!extras)
        return std::nullopt;
    const auto utf16 = Converted<std::u16string>(text.size(), [&](char16_t *out, int32_t room) {
        return extras->to_utf16(text.data(), static_cast<int32_t>(text.size()), tavo::kNoSubstitute, out, room);
    });
    if (!utf16)
        return std::nullopt;
    const auto upper = Converted<std::u16string>(utf16->size() + 16, [&](char16_t *out, int32_t room) {
        return extras->upper(utf16->data(), static_cast<int32_t>(utf16->size()), out, room);
    });
    if (!upper)
        return std::nullopt;
    return Converted<std::string>(3 * upper->size(), [&](char *out, int32_t room) {
        return extras->to_utf8(upper->data(), static_cast<int32_t>(upper->size()), out, room);
    });
}

}  // namespace

extern "C" int TLIBUnicodeUTF8StrUpper(const char *szSrc, char *szDst, int cbDst)
{
    if (!szSrc || cbDst < 0 || (!szDst && cbDst != 0))
        return Fail(ERR_BAD_PARAMETERS);
    const size_t length = std::strlen(szSrc);
    if (length > INT_MAX / 4)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> upper = Upper({szSrc, length});
        if (!upper)
            return Fail(ERR_BAD_PARAMETERS);
        if (szDst && upper->size() >= static_cast<size_t>(cbDst))
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        if (szDst)
            std::memcpy(szDst, upper->c_str(), upper->size() + 1);
        return static_cast<int>(upper->size()) + 1;
    });
}
