// The NT hash of a password.
#include "tavo_user.h"

#include "account/detail/password_text.h"
#include "core/detail/extras.h"
#include "core/detail/guard.h"

extern "C" int TLIBSmbMd4Hash(const char *szPasswd, unsigned char *rgHash)
{
    if (!szPasswd || !rgHash)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::SecretBytes text;
        if (const tavo::Code code = tavo::Utf16LowFirst(szPasswd, text))
            return Fail(code);
        const tavo::Extras *extras = tavo::LoadExtras();
        if (!extras)
            return Fail(ERR_OP_FAILURE);
        extras->md4(reinterpret_cast<const uint8_t *>(text.data()), text.size(), rgHash);
        return 0;
    });
}
