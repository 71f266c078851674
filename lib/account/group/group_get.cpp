// Reads one group by name.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"

#include <array>

extern "C" int TAVOGroupGet(const char *szName, TAVOGROUP **ppGroup)
{
    if (!szName || !*szName || !ppGroup)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName, tavo::kGroupKeySize);
        if (!key)
            return Fail(ERR_INVALID_GROUPNAME);
        tavo::AccountSession session(tavo::kGroupKind);
        if (const tavo::Code code = session.OpenToRead(std::array{size_t{tavo::kGroupNameStore}}))
            return Fail(code);
        const tavo::Result<std::string_view> line = session.View(tavo::kGroupNameStore)->Get(*key);
        if (!line)
            return Fail(line.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_GROUP));
        return TAVOGroupAlloc(ppGroup, std::string(*line).c_str()) == 0 ? 0 : Fail(tavoerrno);
    });
}
