// Passwords in the encodings that the Samba hashes are made of.
#include "account/detail/password_text.h"

#include "tavo_error.h"

#include <memory>
#include <new>

#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>

namespace tavo {
namespace {

constexpr UChar32 kReplacement = 0xFFFD;

struct CloseConverter {
    void operator()(UConverter *converter) const noexcept { ::ucnv_close(converter); }
};

int Code(UErrorCode error)
{
    if (error == U_MEMORY_ALLOCATION_ERROR)
        throw std::bad_alloc();
    return U_FAILURE(error) ? ERR_OP_FAILURE : 0;
}

int Utf16(std::string_view utf8, SecretUtf16 &units)
{
    units.resize(utf8.size() + 1);  // no character has more units than it has bytes
    int32_t length = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strFromUTF8WithSub(units.data(), static_cast<int32_t>(units.size()), &length, utf8.data(),
                         static_cast<int32_t>(utf8.size()), kReplacement, nullptr, &error);
    const int code = Code(error);
    units.resize(code == 0 ? static_cast<size_t>(length) : 0);
    return code;
}

}  // namespace

int UpperCodePage850(std::string_view utf8, SecretBytes &bytes)
{
    SecretUtf16 units;
    if (const int code = Utf16(utf8, units))
        return code;
    SecretUtf16 upper;
    upper.reserve(units.size());
    for (int32_t at = 0; at < static_cast<int32_t>(units.size());) {
        UChar32 character;
        U16_NEXT(units.data(), at, static_cast<int32_t>(units.size()), character);
        const UChar32 larger = u_toupper(character);
        upper.push_back(
            static_cast<char16_t>(larger > 0xFFFF ? kReplacement : larger));  // the code page has none of those
    }
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, CloseConverter> code_page(ucnv_open("ibm-850", &error));
    if (const int code = Code(error))
        return code;
    bytes.resize(2 * upper.size() + 1);
    const int32_t length = ucnv_fromUChars(code_page.get(), bytes.data(), static_cast<int32_t>(bytes.size()),
                                           upper.data(), static_cast<int32_t>(upper.size()), &error);
    const int code = Code(error);
    bytes.resize(code == 0 ? static_cast<size_t>(length) : 0);
    return code;
}

int Utf16LowFirst(std::string_view utf8, SecretBytes &bytes)
{
    SecretUtf16 units;
    if (const int code = Utf16(utf8, units))
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
