// Checks whether a text is one atom of a mail address.
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/name_text.h"

extern "C" int BlTLIBIsAtom(const char *szText)
{
    if (!szText)
        return FailZero(ERR_BAD_PARAMETERS);
    return tavo::IsAtomText(szText) ? 1 : FailZero(ERR_INVALID_NETNAME);
}
