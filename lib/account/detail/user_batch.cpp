// Applies a batch of additions, changes and renames to the open stores.
#include "account/detail/user_batch.h"

#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/id_index.h"
#include "account/detail/user_change.h"

namespace tavo {

UserBatch::Outcome UserBatch::Apply(const char *old_name, const TAVOUSER *user)
{
    if (!user || !user->szName)
        return {.code = ERR_BAD_PARAMETERS};
    if (IsDomainName(user->szName))
        return {};  // lives in its domain
    TAVOUSER wanted = *user;
    const std::string home = kHomes + std::string(user->szName);
    if (!old_name) {
        Code code = 0;
        const bool choose = wanted.nUid == -1;
        if (choose) {
            wanted.nUid = TAVO_USER_UID_MIN;
            code = FindFreeId(*Btree::Of(db_.pUid), kUids, wanted.nUid);
        }
        return Store(nullptr, wanted, code, choose);
    }
    wanted.szHome = const_cast<char *>(home.c_str());
    const std::optional<std::string> old_key = AccountKey(old_name);
    if (old_key && !old_keys_.insert(*old_key).second)
        return {.code = ERR_KEY_EXISTS, .duplicate = true};
    return Store(old_name, wanted, 0, false);
}

UserBatch::Outcome UserBatch::Store(const char *old_name, const TAVOUSER &user, int uid_code, bool uid_is_chosen)
{
    UserChange change;
    const Hashing hashing{::time(nullptr), method_};
    if (const Code code = PrepareUser(db_, old_name, user, hashing, change))
        return {.code = code, .absent = old_name && code == ERR_NO_SUCH_USER};
    if (change.key != change.old_key && is_pending_(change.key))
        return {.code = ERR_REMOVE_FAILED};
    if (uid_code != 0)
        return {.code = uid_code};
    if (const Code code = StoreUser(db_, change))
        return {.code = code, .damaged = true};
    if (uid_is_chosen)
        if (const Code code = Btree::Of(db_.pUid)->SetNumber(kCurrentUidKey, change.uid))
            return {.code = code, .damaged = true};
    done_.push_back({user.szName, change.old_name, change.uid,
                     user.nGid < 0 ? int32_t{TAVO_USER_GID_DEFAULT} : user.nGid, change.new_password, user.szPasswd});
    return {};
}

}  // namespace tavo
