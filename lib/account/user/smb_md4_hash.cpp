// The NT hash of a password.
#include "tavo_user.h"

#include "account/detail/password_text.h"
#include "core/detail/guard.h"

#include <nettle/md4.h>

extern "C" int TLIBSmbMd4Hash(const char *szPasswd, unsigned char *rgHash)
{
    if (!szPasswd || !rgHash)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::SecretBytes text;
        if (const int code = tavo::Utf16LowFirst(szPasswd, text))
            return Fail(code);
        tavo::Wiped<md4_ctx> md4;
        nettle_md4_init(&md4);
        nettle_md4_update(&md4, text.size(), reinterpret_cast<const uint8_t *>(text.data()));
        nettle_md4_digest(&md4, MD4_DIGEST_SIZE, rgHash);
        return 0;
    });
}
