// Checks whether a text is a mail address.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/name_text.h"

extern "C" int BlTLIBIsMailbox(const char *szText)
{
    if (!szText)
        return FailZero(ERR_BAD_PARAMETERS);
    return tavo::IsMailboxText(szText) ? 1 : FailZero(ERR_INVALID_NETNAME);
}
