// Names of the network as text.
#include "network/detail/name_text.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr size_t kLongestDomain = 255;
constexpr size_t kLongestLabel = 63;

bool IsLabel(std::string_view text) noexcept
{
    return !text.empty() && text.size() <= kLongestLabel && text.front() != '-' && text.back() != '-' &&
           std::all_of(text.begin(), text.end(),
                       [](char byte) { return IsLetter(byte) || IsDigit(byte) || byte == '-'; });
}

// True when there is at least one piece between the dots and each one passes.
template <class Passes>
bool AllBetweenDots(std::string_view text, Passes passes) noexcept
{
    for (;;) {
        const size_t dot = text.find('.');
        if (!passes(text.substr(0, dot)))
            return false;
        if (dot == std::string_view::npos)
            return true;
        text.remove_prefix(dot + 1);
    }
}

}  // namespace

bool IsDomainText(std::string_view text) noexcept
{
    return text.size() <= kLongestDomain && AllBetweenDots(text, IsLabel);
}

bool IsAtomText(std::string_view text) noexcept
{
    constexpr std::string_view specials = "\"(),.:;<>[]\\@";
    return !text.empty() && std::all_of(text.begin(), text.end(), [&](char byte) {
        return byte > ' ' && byte < 0x7F && specials.find(byte) == std::string_view::npos;
    });
}

bool IsMailboxText(std::string_view text) noexcept
{
    const size_t at = text.find('@');
    if (at == text.npos || !AllBetweenDots(text.substr(0, at), IsAtomText))
        return false;
    text.remove_prefix(at + 1);
    return IsDomainText(text);
}

}  // namespace tavo
