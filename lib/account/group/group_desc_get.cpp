// Reads the description of a group.
#include "tavo_group.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_texts.h"
#include "core/detail/guard.h"

#include <array>
#include <cstring>

extern "C" int TAVOGroupDescGet(const char *szName, char *szBuf, int cbBuf)
{
    if (!szName || !*szName || cbBuf < 0 || (!szBuf && cbBuf != 0))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> key = tavo::AccountKey(szName, tavo::kGroupKeySize);
        if (!key)
            return Fail(ERR_INVALID_GROUPNAME);
        tavo::AccountSession session(tavo::kGroupKind);
        constexpr std::array stores{size_t{tavo::kGroupNameStore}, size_t{tavo::kDescStore}};
        if (const tavo::Code code = session.OpenToRead(stores))
            return Fail(code);
        if (const tavo::Code code = tavo::ReadGroupLine(*session.View(tavo::kGroupNameStore), *key).Failure())
            return Fail(code);
        const tavo::Result<std::string_view> line = session.View(tavo::kDescStore)->Get(*key);
        if (!line && line.Failure() != ERR_KEY_NOT_FOUND)
            return Fail(line.Failure());
        const std::string text(line ? tavo::GroupDescription(*line) : std::string_view());
        const size_t length = text.size() + 1;
        if (szBuf && length > static_cast<size_t>(cbBuf))
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        if (szBuf)
            std::memcpy(szBuf, text.c_str(), length);
        return static_cast<int>(length);
    });
}
