// How long passwords are valid, and whether Samba lets an account in.
#include "account/password_ages.h"

#include "tavo_user.h"

#include "account/account_check.h"
#include "account/account_rules.h"
#include "frame/text.h"

namespace tavoctl {
namespace {

enum ShadowField : unsigned char { least_field = 3, most_field, warning_field, shadow_fields = 9 };
enum SambaField : unsigned char { flags_field = 4, samba_fields = 7 };

}  // namespace

bool PasswordAges::IsFixed() const
{
    return least && most && *most <= *least;
}

bool PasswordAges::IsUsual() const
{
    constexpr int usual_most = 99999;
    constexpr int usual_warning = 7;
    return warning == usual_warning && (IsFixed() || (least == 0 && most == usual_most));
}

AgesByKey ReadPasswordAges()
{
    AgesByKey ages;
    for (const auto &fields : FieldsIn("/etc/shadow"))
        if (fields.size() == shadow_fields)
            ages.emplace(AccountKey(fields[0]),
                         PasswordAges{NumberIn<int>(fields[least_field]), NumberIn<int>(fields[most_field]),
                                      NumberIn<int>(fields[warning_field])});
    return ages;
}

PasswordAges AgesOf(const std::string &user)
{
    const AgesByKey ages = ReadPasswordAges();
    const auto found = ages.find(AccountKey(user));
    return found == ages.end() ? PasswordAges{} : found->second;
}

void RestoreAges(const AgesByKey &before, const std::string &old_name, const std::string &name)
{
    const auto old = before.find(AccountKey(old_name));
    if (old == before.end() || old->second.IsUsual())
        return;
    const PasswordAges now = AgesOf(name);
    const bool fixed = old->second.IsFixed() || now.IsFixed();
    const auto changed = [](std::optional<int> wanted, std::optional<int> present) {
        return wanted && wanted != present ? *wanted : -1;
    };
    const int least = fixed ? -1 : changed(old->second.least, now.least);
    const int most = fixed ? -1 : changed(old->second.most, now.most);
    const int warning = changed(old->second.warning, now.warning);
    if (least >= 0 || most >= 0 || warning >= 0)
        Must(TAVOUserAgingSet(name.c_str(), least, most, warning) == 0,
             "set the age of the password of " + name + " again");
}

std::string SambaState(const std::string &user)
{
    for (const auto &fields : FieldsIn("/usr/tavo/etc/private/smbpasswd"))
        if (fields.size() == samba_fields && AccountKey(fields[0]) == AccountKey(user))
            return fields[flags_field].find('D') == std::string::npos ? "on" : "disabled";
    return "none";
}

}  // namespace tavoctl
