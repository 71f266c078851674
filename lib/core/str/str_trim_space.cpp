// Removes the white space around a text and one pair of quotes around the rest.
#include "tavo_str.h"

#include "core/detail/fault.h"
#include "core/detail/key_value_line.h"
#include "core/detail/text_overlap.h"

#include <cstring>
#include <string_view>

extern "C" int TLIBStrTrimSpace(char *szSrc, char *szDst)
{
    if (!szSrc)
        return Fail(ERR_BAD_PARAMETERS);
    if (!szDst)
        szDst = szSrc;
    const size_t length = std::strlen(szSrc);
    const std::string_view trimmed = tavo::TrimSetting({szSrc, length});
    if (szDst != szSrc && tavo::Overlap(szSrc, length + 1, szDst, trimmed.size() + 1))
        return Fail(ERR_BAD_PARAMETERS);
    std::memmove(szDst, trimmed.data(), trimmed.size());
    szDst[trimmed.size()] = '\0';
    return static_cast<int>(trimmed.size());
}
