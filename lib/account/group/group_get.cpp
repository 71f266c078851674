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
        if (const int code = session.OpenToRead(std::array{size_t{tavo::kGroupNameStore}}))
            return Fail(code);
        std::string_view line;
        if (const int code = session.View(tavo::kGroupNameStore)->Get(*key, line))
            return Fail(code == ERR_KEY_NOT_FOUND ? int{ERR_NO_SUCH_GROUP} : code);
        return TAVOGroupAlloc(ppGroup, std::string(line).c_str()) == 0 ? 0 : Fail(tavoerrno);
    });
}
