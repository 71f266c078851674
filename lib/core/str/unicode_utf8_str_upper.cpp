// Copies a UTF-8 text in upper case.
#include "tavo_str.h"

#include "core/detail/guard.h"

#include <climits>
#include <cstring>
#include <string>

#include <unicode/ustring.h>

namespace {

// Account names are keyed by this: a language of the process must not change where a name is found.
constexpr const char *kNoLanguage = "";

// ICU answers by code; what does not fit is told by the length, so only these are failures here.
bool Converted(UErrorCode error)
{
    return U_SUCCESS(error) || error == U_BUFFER_OVERFLOW_ERROR;
}

// Empty when the text is not UTF-8 (or is too long for ICU); empty text does not come here.
std::u16string ToUtf16(const char *text, int32_t length)
{
    std::u16string utf16(static_cast<size_t>(length), u'\0');  // never longer than the UTF-8 text
    int32_t units = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strFromUTF8(utf16.data(), length, &units, text, length, &error);
    utf16.resize(U_SUCCESS(error) ? static_cast<size_t>(units) : 0);
    return utf16;
}

std::u16string Upper(const std::u16string &text)
{
    std::u16string upper(text.size() + 16, u'\0');
    for (;;) {
        UErrorCode error = U_ZERO_ERROR;
        const int32_t units = u_strToUpper(upper.data(), static_cast<int32_t>(upper.size()), text.data(),
                                           static_cast<int32_t>(text.size()), kNoLanguage, &error);
        const bool fits = static_cast<size_t>(units) <= upper.size();
        upper.resize(Converted(error) ? static_cast<size_t>(units) : 0);
        if (fits)
            return upper;
    }
}

int CopyAsUtf8(const std::u16string &text, char *buffer, int size)
{
    int32_t length = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strToUTF8(nullptr, 0, &length, text.data(), static_cast<int32_t>(text.size()), &error);
    if (!Converted(error) || length == INT_MAX || (buffer && length >= size))
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    if (buffer) {
        error = U_ZERO_ERROR;
        u_strToUTF8(buffer, size, nullptr, text.data(), static_cast<int32_t>(text.size()), &error);
    }
    return length + 1;
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
        const std::u16string text = ToUtf16(szSrc, static_cast<int32_t>(length));
        if (text.empty() && length > 0)
            return Fail(ERR_BAD_PARAMETERS);
        return CopyAsUtf8(Upper(text), szDst, cbDst);
    });
}
