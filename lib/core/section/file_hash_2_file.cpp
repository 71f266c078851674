// Writes a section, or pairs alone, to a stream.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_format.h"
#include "core/detail/section_header.h"

#include <string>

namespace {

std::optional<std::string> PairLines(const TLIBSZHASH *pairs, const char *format)
{
    std::string lines;
    for (int i = 0; i < pairs->nSlot; ++i) {
        const TLIBSZHASHSLOT &slot = pairs->slots[i];
        if (!slot.pszKey)
            continue;
        if (!tavo::IsWritableKey(slot.pszKey) || !tavo::IsWritableValue(slot.pszValue))
            return std::nullopt;
        lines += tavo::FormatLine(format, slot.pszKey, slot.pszValue).value();
    }
    return lines;
}

bool Write(FILE *stream, const std::string &text)
{
    return std::fwrite(text.data(), 1, text.size(), stream) == text.size();
}

}  // namespace

extern "C" int ErrTLIBIFileHash2File(FILE *pfStream, const char *szSection, const TLIBSZHASH *pshPairs,
                                     const char *szFormat)
{
    if (!pfStream || !pshPairs || (szSection && !tavo::IsWritableSectionName(szSection)))
        return Fail(ERR_BAD_PARAMETERS);
    if (TLIBIFileCheckFormat(szFormat) != 0)
        return Fail(tavoerrno, Line{54});
    return Guard([&] {
        const std::optional<std::string> lines = PairLines(pshPairs, szFormat);
        if (!lines)
            return Fail(ERR_BAD_PARAMETERS);
        if (szSection && !Write(pfStream, "[" + std::string(szSection) + "]\n"))
            return Fail(ERR_WRITE_FAILED, Line{60});
        return Write(pfStream, *lines) ? 0 : Fail(ERR_WRITE_FAILED, Line{74});
    });
}
