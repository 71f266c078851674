// Finds the user that a quota is about.
#include "account/detail/quota_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/group_owner.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_texts.h"
#include "core/detail/keep_fault.h"

#include <array>

namespace tavo {
namespace {

// Not the whole record: programs that are not root have quotas, too, and no business with hashes.
Code FindUid(const char *name, int32_t &uid)
{
    const std::optional<std::string> key = AccountKey(name);
    if (!key)
        return ERR_NO_SUCH_USER;
    AccountSession session(kUserKind);
    if (const Code code = session.OpenToRead(std::array{size_t{kNameStore}}))
        return code;
    const Result<PasswdLine> line = ReadPasswdLine(*session.View(kNameStore), *key);
    if (line)
        uid = line->uid;
    return line.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
}

}  // namespace

Code FindQuotaUser(const char *name, int32_t &uid)
{
    const KeepFault keep;
    const Code code = FindUid(name, uid);
    if (code != ERR_NO_SUCH_USER)
        return code;
    // Groups have no quotas, whichever way they are spelled in lists of names.
    GroupOwner group;
    if (*name == '@' || TAVOGroupGet(name, group.Fill()) == 0)
        return ERR_SYS_UNKNOWN;
    return ERR_NO_SUCH_USER;
}

}  // namespace tavo
