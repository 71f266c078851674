// Which accounts an enumeration lists.
#include "account/detail/user_enumeration.h"

#include "tavo_appliance.h"
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/passwd_line.h"
#include "account/detail/user_texts.h"
#include "core/detail/list_owner.h"
#include "core/detail/setting_switch.h"

#include <array>

namespace tavo {
namespace {

constexpr int kAllFlags = TAVO_USER_LOCAL | TAVO_USER_DOMAIN | TAVO_USER_DOMAIN_USED;

bool IsListed(const PasswdLine &account, bool guest_is_supported)
{
    if (account.uid == 0 && account.name != "root")
        return false;
    return IsDomainName(account.name) || account.uid == -1 ||
           (account.uid >= TAVO_USER_UID_MIN && (account.uid != TAVO_USER_UID_GUEST || guest_is_supported));
}

Code AddDomainUsersInUse(const KeyFilter &wanted, std::vector<std::string> &names)
{
    ListOwner list(PslTLIBSzListAlloc(1024));
    if (!list)
        return ERR_OUT_OF_MEMORY;
    const int count = TAVOPushDUserUsed(list.Addr());
    if (count < 0)
        return ERR_ENUM_FAILED;
    for (int i = 0; i < count; ++i) {
        const std::string name = SzTLIBSzListGet(list.Get(), i);
        const std::optional<std::string> key = AccountKey(name);
        if (key && wanted(std::string_view(*key).substr(0, key->size() - 1)))
            names.push_back(name);
    }
    return 0;
}

Result<AccountNames> ListUsers(int flags, const KeyFilter &wanted)
{
    if ((flags & kAllFlags) == 0)
        return ERR_BAD_PARAMETERS;
    AccountNames names;
    if ((flags & TAVO_USER_DOMAIN_USED) != 0)
        if (const Code code = AddDomainUsersInUse(wanted, names))
            return code;
    AccountSession session(kUserKind);
    if (const Code code = session.OpenToRead(std::array{size_t{kNameStore}}))
        return code;
    const std::optional<bool> guest_is_supported = ReadSetting(kFactorySettings, "supportguest", "yes");
    if (!guest_is_supported)
        return ERR_ENUM_FAILED;
    const auto name_of = [&](std::string_view line) -> std::optional<std::string> {
        const Result<PasswdLine> account = ParsePasswdLine(line);
        const int kind = account && IsDomainName(account->name) ? TAVO_USER_DOMAIN : TAVO_USER_LOCAL;
        return account && (flags & kind) != 0 && IsListed(*account, *guest_is_supported) ? std::optional(account->name)
                                                                                         : std::nullopt;
    };
    Result<AccountNames> stored = NamesIn(*session.View(kNameStore), wanted, name_of);
    if (stored)
        stored->insert(stored->begin(), names.begin(), names.end());
    return stored;
}

}  // namespace

constexpr NameSource kUserNames{kUserKeySize, ListUsers};

}  // namespace tavo
