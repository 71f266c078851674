// Removes the white space around a text and one pair of quotes around the rest.
#include "tavo_str.h"

#include "core/detail/fault.h"
#include "core/detail/text_overlap.h"

#include <cstring>
#include <string_view>

namespace {

constexpr std::string_view kWhiteSpace = "\t\n\r ";

std::string_view Trimmed(std::string_view text)
{
    const size_t first = text.find_first_not_of(kWhiteSpace);
    if (first == text.npos)
        return text.substr(0, 0);
    text = text.substr(0, text.find_last_not_of(kWhiteSpace) + 1);
    text.remove_prefix(first);
    // A lone '"' is text.
    if (text.size() > 1 && text.front() == '"' && text.back() == '"') {
        text.remove_prefix(1);
        text.remove_suffix(1);
    }
    return text;
}

}  // namespace

extern "C" int TLIBStrTrimSpace(char *szSrc, char *szDst)
{
    if (!szSrc)
        return Fail(ERR_BAD_PARAMETERS);
    if (!szDst)
        szDst = szSrc;
    const size_t length = std::strlen(szSrc);
    const std::string_view trimmed = Trimmed({szSrc, length});
    if (szDst != szSrc && tavo::Overlap(szSrc, length + 1, szDst, trimmed.size() + 1))
        return Fail(ERR_BAD_PARAMETERS);
    std::memmove(szDst, trimmed.data(), trimmed.size());
    szDst[trimmed.size()] = '\0';
    return static_cast<int>(trimmed.size());
}
