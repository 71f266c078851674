// Computes how many more accounts may be created.
#include "tavo_file.h"
#include "tavo_user.h"

#include "core/detail/fault.h"
#include "core/detail/setting_switch.h"
#include "core/detail/strict_number.h"

namespace {

constexpr int kLongestNumber = 32;

}  // namespace

extern "C" int TAVOConfGetUserLimit(void)
{
    const int count = TAVOUserTotalNum(TAVO_USER_LOCAL | TAVO_USER_DOMAIN);
    if (count < 0)
        return -1;
    char text[kLongestNumber + 1];
    const int length = TLIBFileGetKeyValue(tavo::kFactorySettings, "maxaccounts", text, sizeof text, 0);
    if (length < 0)
        return -1;
    if (length == 0)
        return Fail(ERR_KEY_NOT_FOUND);
    if (text[0] == 0)
        return 0;
    const auto limit = tavo::StrictNumber<int>(text);
    if (!limit || *limit < 0)
        return Fail(ERR_FORMAT_ERROR);
    return *limit - count;
}
