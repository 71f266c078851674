// Unicode, from ICU.
#include "core/detail/extras.h"
#include "extras/parts.h"

#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>

namespace tavo::extras {
namespace {

// Account names are keyed by this: a language of the process must not change where a name is found.
constexpr const char *kNoLanguage = "";

// ICU reports failures by code, but a result that does not fit only by its length.
int32_t Length(UErrorCode error, int32_t length)
{
    if (U_SUCCESS(error) || error == U_BUFFER_OVERFLOW_ERROR)
        return length;
    return error == U_MEMORY_ALLOCATION_ERROR ? kNoMemory : kNoResult;
}

}  // namespace

int32_t Fold(int32_t code_point, int32_t *out, int32_t room) noexcept
{
    UChar source[2];
    int32_t length = 0;
    U16_APPEND_UNSAFE(source, length, code_point);
    UChar folded[16];
    UErrorCode error = U_ZERO_ERROR;
    const int32_t units = u_strFoldCase(folded, 16, source, length, U_FOLD_CASE_DEFAULT, &error);
    if (U_FAILURE(error) || units < 1) {
        *out = u_foldCase(code_point, U_FOLD_CASE_DEFAULT);
        return 1;
    }
    int32_t count = 0;
    for (int32_t at = 0; at < units && count < room; ++count)
        U16_NEXT_UNSAFE(folded, at, out[count]);
    return count;
}

int32_t ToUtf16(const char *text, int32_t length, int32_t substitute, char16_t *out, int32_t room) noexcept
{
    int32_t units = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strFromUTF8WithSub(out, room, &units, text, length, substitute, nullptr, &error);
    return Length(error, units);
}

int32_t ToUtf8(const char16_t *text, int32_t length, char *out, int32_t room) noexcept
{
    int32_t bytes = 0;
    UErrorCode error = U_ZERO_ERROR;
    u_strToUTF8(out, room, &bytes, text, length, &error);
    return Length(error, bytes);
}

int32_t Upper(const char16_t *text, int32_t length, char16_t *out, int32_t room) noexcept
{
    UErrorCode error = U_ZERO_ERROR;
    const int32_t units = u_strToUpper(out, room, text, length, kNoLanguage, &error);
    return Length(error, units);
}

int32_t UpperOne(int32_t code_point) noexcept
{
    return u_toupper(code_point);
}

int32_t ToCodePage850(const char16_t *text, int32_t length, char *out, int32_t room) noexcept
{
    UErrorCode error = U_ZERO_ERROR;
    UConverter *code_page = ucnv_open("ibm-850", &error);
    if (U_FAILURE(error))
        return Length(error, 0);
    const int32_t bytes = ucnv_fromUChars(code_page, out, room, text, length, &error);
    ucnv_close(code_page);
    return Length(error, bytes);
}

}  // namespace tavo::extras
