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
        if (const tavo::Code code = session.OpenToRead(stores))
            return Fail(code);
        const tavo::Result<std::string> key = tavo::FindGroupKey(session, gid);
        if (!key)
            return Fail(key.Failure());
        const tavo::Result<std::string_view> line = session.View(tavo::kGroupNameStore)->Get(*key);
        if (!line)
            return Fail(line.Failure());
        return TAVOGroupAlloc(ppGroup, std::string(*line).c_str()) == 0 ? 0 : Fail(tavoerrno);
    });
}
