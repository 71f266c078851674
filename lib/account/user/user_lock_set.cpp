// Locks the password of an account, and unlocks it.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "account/detail/smbpasswd_line.h"
#include "account/detail/user_lines.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserLockSet(const char *szName, int fLocked)
{
    return Guard([&] {
        return tavo::ChangeUserLines(szName, [&](tavo::UserLines &lines) -> tavo::Code {
            tavo::Result<std::string> shadow = tavo::ReplaceShadowLock(lines.shadow, fLocked != 0);
            if (!shadow)
                return shadow.Failure();
            lines.shadow = std::move(*shadow);
            if (lines.samba.empty())
                return 0;
            tavo::Result<tavo::SmbpasswdLine> samba = tavo::ParseSmbpasswdLine(lines.samba);
            if (!samba)
                return samba.Failure();
            if (tavo::HasDisabledFlag(samba->flags) == (fLocked != 0))
                return 0;  // also where there is more in the line than that
            samba->flags = tavo::WithDisabledFlag(samba->flags, fLocked != 0);
            lines.samba = tavo::FormatSmbpasswdLine(*samba);
            return 0;
        });
    });
}
