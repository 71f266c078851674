// Reads one group by its group id.
#include "tavo_group.h"

#include "account/detail/account_session.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"

#include <array>

extern "C" int TAVOGroupGetByGID(int gid, TAVOGROUP **ppGroup)
{
    if (!ppGroup)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kGroupKind);
        constexpr std::array stores{size_t{tavo::kGroupNameStore}, size_t{tavo::kGidStore}};
        if (const int code = session.OpenToRead(stores))
            return Fail(code);
        std::string key;
        std::string_view line;
        int code = tavo::FindGroupKey(session, gid, key);
        if (code == 0)
            code = session.View(tavo::kGroupNameStore)->Get(key, line);
        if (code != 0)
            return Fail(code);
        return TAVOGroupAlloc(ppGroup, std::string(line).c_str()) == 0 ? 0 : Fail(tavoerrno);
    });
}
