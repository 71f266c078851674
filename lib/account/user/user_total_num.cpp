// Counts the accounts.
#include "tavo_user.h"

#include "account/detail/user_enumeration.h"
#include "core/detail/guard.h"

extern "C" int TAVOUserTotalNum(int flags)
{
    return Guard([&] {
        std::vector<std::string> names;
        if (const tavo::Code code = tavo::ListUsers(
                flags, [](std::string_view) { return true; }, names))
            return Fail(code);
        return static_cast<int>(names.size());
    });
}
