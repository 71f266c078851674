// Checks whether a text can be the appliance's host name, which is also its name in Windows networks.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/name_text.h"

extern "C" int BlTLIBIsHostname(const char *szName)
{
    if (!szName)
        return FailZero(ERR_BAD_PARAMETERS);
    const std::string_view name = szName;
    if (name.empty() || name.size() > tavo::kLongestNetbiosName || !(tavo::IsLetter(name[0]) || name[0] == '_'))
        return FailZero(ERR_INVALID_NETNAME);
    for (const char byte : name) {
        if (!tavo::IsLetter(byte) && !tavo::IsDigit(byte) && byte != '-' && byte != '_')
            return FailZero(ERR_INVALID_NETNAME);
    }
    return 1;
}
