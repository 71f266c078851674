// A batch of additions, changes and renames, applied to the open stores entry by entry.
#ifndef TAVO_ACCOUNT_DETAIL_USER_BATCH_H
#define TAVO_ACCOUNT_DETAIL_USER_BATCH_H

#include "account/detail/password_hash.h"
#include "account/detail/user_accounts.h"
#include "core/detail/result.h"

#include <functional>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace tavo {

// Signals after a change.
inline constexpr int kReadAccountsAgain = 10;  // for the download scheduler
inline constexpr int kAccountsChanged = 47;    // for the event daemon

// The consequences of an applied entry for the rest of the system.
struct DoneUser {
    std::string name;
    std::string old_name;  // empty: added
    int32_t uid;
    int32_t gid;
    bool new_password;
    const char *password;  // the caller's: clear text when it is new

    bool IsAdded() const { return old_name.empty(); }
    bool IsRenamed() const { return !old_name.empty() && old_name != name; }
};

class UserBatch {
  public:
    // `is_pending`: whether rights of a deleted or renamed account of that key still have to be removed. Until then no
    // account can get its name.
    UserBatch(const TAVOUSERDB &db, std::function<bool(const std::string &key)> is_pending)
        : db_(db), is_pending_(std::move(is_pending))
    {
    }

    // How an entry came out. A damaged store ends the batch: nothing of it may be kept.
    struct Outcome {
        Code code = 0;
        bool damaged = false;
        bool duplicate = false;  // the old name was given before
        bool absent = false;     // the old name is not an account
    };

    Outcome Apply(const char *old_name, const TAVOUSER *user);

    const std::vector<DoneUser> &Done() const { return done_; }

  private:
    Outcome Store(const char *old_name, const TAVOUSER &user, int uid_code, bool uid_is_chosen);

    const TAVOUSERDB &db_;
    const std::function<bool(const std::string &key)> is_pending_;
    const HashMethod method_ = ConfiguredHashMethod();
    std::set<std::string> old_keys_;
    std::vector<DoneUser> done_;
};

}  // namespace tavo

#endif
