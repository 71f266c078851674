// Picks the names of existing accounts out of a list of names.
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"

#include <array>
#include <cstring>

extern "C" int TAVOUserGetValidUserList(const char *const *rgszName, char *szBuf, int cbBuf)
{
    if (!rgszName || cbBuf < 0 || (!szBuf && cbBuf != 0))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::AccountSession session(tavo::kUserKind);
        if (const tavo::Code code = session.OpenToRead(std::array{size_t{tavo::kNameStore}}))
            return Fail(code);
        std::string valid;
        for (; *rgszName; ++rgszName) {
            const std::optional<std::string> key = tavo::AccountKey(*rgszName);
            if (!**rgszName || !key)
                continue;
            const tavo::Code code = session.View(tavo::kNameStore)->Get(*key).Failure();
            if (code == 0)
                valid.append(valid.empty() ? "" : ",").append(*rgszName);
            else if (code != ERR_KEY_NOT_FOUND)
                return Fail(code);
        }
        const size_t length = valid.size() + 1;
        if (szBuf && length > static_cast<size_t>(cbBuf))
            return Fail(ERR_NOT_ENOUGH_MEMORY);
        if (szBuf)
            std::memcpy(szBuf, valid.c_str(), length);
        return static_cast<int>(length);
    });
}
