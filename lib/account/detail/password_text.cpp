// Passwords in the encodings that the Samba hashes are made of.
#include "account/detail/password_text.h"

#include <memory>

#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>

namespace tavo {
namespace {

constexpr UChar32 kReplacement = 0xFFFD;

std::u16string Utf16(std::string_view utf8)
{
    std::u16string units(utf8.size(), u'\0');  // no character has more units than it has bytes
    int32_t length = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strFromUTF8WithSub(units.data(), static_cast<int32_t>(units.size()), &length, utf8.data(),
                         static_cast<int32_t>(utf8.size()), kReplacement, nullptr, &error);
    units.resize(static_cast<size_t>(length));
    return units;
}

}  // namespace

std::string UpperCodePage850(std::string_view utf8)
{
    const std::u16string units = Utf16(utf8);
    std::u16string upper;
    for (int32_t at = 0; at < static_cast<int32_t>(units.size());) {
        UChar32 character;
        U16_NEXT(units.data(), at, static_cast<int32_t>(units.size()), character);
        UChar32 larger = u_toupper(character);
        upper += static_cast<char16_t>(larger > 0xFFFF ? kReplacement : larger);  // the code page has none of those
    }
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, decltype(&ucnv_close)> code_page(ucnv_open("ibm-850", &error), ucnv_close);
    std::string bytes(2 * upper.size() + 1, '\0');
    const int32_t length = ucnv_fromUChars(code_page.get(), bytes.data(), static_cast<int32_t>(bytes.size()),
                                           upper.data(), static_cast<int32_t>(upper.size()), &error);
    bytes.resize(U_SUCCESS(error) ? static_cast<size_t>(length) : 0);
    return bytes;
}

std::string Utf16LowFirst(std::string_view utf8)
{
    std::string bytes;
    for (const char16_t unit : Utf16(utf8)) {
        bytes += static_cast<char>(unit & 0xFF);
        bytes += static_cast<char>(unit >> 8);
    }
    return bytes;
}

}  // namespace tavo
