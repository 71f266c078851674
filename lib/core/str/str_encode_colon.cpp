// Encodes a text for a field of a line of colon-separated fields.
#include "tavo_str.h"

#include "core/detail/colon_code.h"
#include "core/detail/fault.h"
#include "core/detail/text_overlap.h"

#include <climits>
#include <cstring>

namespace {

// Returns the encoding of the first byte. A percent sign is only encoded where decoding would read one of the
// sequences, so most descriptions with a percent sign stay readable in the file.
std::string_view Encoded(std::string_view text)
{
    if (text.front() != '%') {
        for (const tavo::ColonCode &code : tavo::kColonCodes) {
            if (code.plain == text.front())
                return code.encoded;
        }
    } else if (tavo::CodeAt(text)) {
        return tavo::kColonCodes.front().encoded;
    }
    return text.substr(0, 1);
}

}  // namespace

extern "C" int TLIBStrEncodeColon(const char *szSrc, char *szDst, int cbDst)
{
    if (!szSrc || cbDst < 0 || (!szDst && cbDst != 0))
        return Fail(ERR_BAD_PARAMETERS);
    const std::string_view text(szSrc);
    if (szDst && tavo::Overlap(szSrc, text.size() + 1, szDst, static_cast<size_t>(cbDst)))
        return Fail(ERR_BAD_PARAMETERS);
    size_t length = 1;
    for (size_t at = 0; at < text.size(); ++at)
        length += Encoded(text.substr(at)).size();
    if (length > INT_MAX || (szDst && length > static_cast<size_t>(cbDst)))
        return Fail(ERR_NOT_ENOUGH_MEMORY);
    if (szDst) {
        for (size_t at = 0; at < text.size(); ++at) {
            const std::string_view encoded = Encoded(text.substr(at));
            std::memcpy(szDst, encoded.data(), encoded.size());
            szDst += encoded.size();
        }
        *szDst = '\0';
    }
    return static_cast<int>(length);
}
