// Checks whether a text can be the name of a Windows workgroup.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/name_text.h"

namespace {

bool IsAllowed(char byte)
{
    constexpr std::string_view marks = " !@#$%^&()-_'{}.~";
    return tavo::IsLetter(byte) || tavo::IsDigit(byte) || marks.find(byte) != std::string_view::npos;
}

}  // namespace

extern "C" int BlTLIBIsWorkGroupName(const char *szName)
{
    if (!szName)
        return FailZero(ERR_BAD_PARAMETERS);
    const std::string_view name = szName;
    if (name.empty() || name.size() > tavo::kLongestNetbiosName)
        return FailZero(ERR_INVALID_NETNAME);
    // Blanks may stand inside only: at the end they are the padding of the name on the wire.
    if (name.front() == '.' || name.front() == ' ' || name.back() == ' ')
        return FailZero(ERR_INVALID_NETNAME);
    for (const char byte : name) {
        if (!IsAllowed(byte))
            return FailZero(ERR_INVALID_NETNAME);
    }
    return 1;
}
