// Sets how long a password is valid.
#include "tavo_user.h"

#include "account/detail/shadow_line.h"
#include "account/detail/user_lines.h"
#include "core/detail/guard.h"

namespace {

constexpr int kMostDays = 99999;

std::optional<int32_t> Days(int days)
{
    return days == -1 ? std::nullopt : std::optional<int32_t>(days);
}

}  // namespace

extern "C" int TAVOUserAgingSet(const char *szName, int nMin, int nMax, int nWarn)
{
    for (const int days : {nMin, nMax, nWarn})
        if (days < -1 || days > kMostDays)
            return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        return tavo::ChangeUserLines(szName, [&](tavo::UserLines &lines) {
            tavo::Result<std::string> shadow =
                tavo::ReplaceShadowAges(lines.shadow, {Days(nMin), Days(nMax), Days(nWarn)});
            if (shadow)
                lines.shadow = std::move(*shadow);
            return shadow.Failure();
        });
    });
}
