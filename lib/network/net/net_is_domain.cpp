// Checks whether a text is a domain name.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/name_text.h"

extern "C" int BlTLIBIsDomain(const char *szText)
{
    if (!szText)
        return FailZero(ERR_BAD_PARAMETERS);
    return tavo::IsDomainText(szText) ? 1 : FailZero(ERR_INVALID_NETNAME);
}
