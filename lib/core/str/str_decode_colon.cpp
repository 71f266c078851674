// Decodes a field of a line of colon-separated fields.
#include "tavo_str.h"

#include "core/detail/colon_code.h"
#include "core/detail/fault.h"
#include "core/detail/text_overlap.h"

#include <climits>

namespace {

// Decodes and returns the first byte, and advances the text.
char NextDecoded(std::string_view &text)
{
    const tavo::ColonCode *code = tavo::CodeAt(text);
    const char plain = code ? code->plain : text.front();
    text.remove_prefix(code ? code->encoded.size() : 1);
    return plain;
}

}  // namespace

extern "C" int TLIBStrDecodeColon(const char *szSrc, char *szDst, int cbDst)
{
    if (!szSrc || cbDst < 0 || (!szDst && cbDst != 0))
        return Fail(ERR_BAD_PARAMETERS);
    const std::string_view text(szSrc);
    if (szDst && szDst != szSrc && tavo::Overlap(szSrc, text.size() + 1, szDst, static_cast<size_t>(cbDst)))
        return Fail(ERR_BAD_PARAMETERS);
    size_t length = 1;
    for (std::string_view rest = text; !rest.empty(); ++length)
        NextDecoded(rest);
    if (length > INT_MAX || (szDst && length > static_cast<size_t>(cbDst)))
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    if (szDst) {
        // The result is never longer than the text read, so decoding in place overwrites nothing unread.
        for (std::string_view rest = text; !rest.empty(); ++szDst)
            *szDst = NextDecoded(rest);
        *szDst = '\0';
    }
    return static_cast<int>(length);
}
