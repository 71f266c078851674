// Locks the password of an account, and unlocks it.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "account/detail/smbpasswd_line.h"
#include "account/detail/user_lines.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserLockSet(const char *szName, int fLocked)
{
    return Guard([&] {
        return tavo::ChangeUserLines(szName, [&](tavo::UserLines &lines) {
            const std::string old = lines.shadow;
            if (const int code = tavo::ReplaceShadowLock(old, fLocked != 0, lines.shadow))
                return code;
            if (lines.samba.empty())
                return 0;
            tavo::SmbpasswdLine samba;
            if (const int code = tavo::ParseSmbpasswdLine(lines.samba, samba))
                return code;
            if (tavo::HasDisabledFlag(samba.flags) == (fLocked != 0))
                return 0;  // also where there is more in the line than that
            samba.flags = tavo::WithDisabledFlag(samba.flags, fLocked != 0);
            lines.samba = tavo::FormatSmbpasswdLine(samba);
            return 0;
        });
    });
}
