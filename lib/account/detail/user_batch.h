// A batch of additions, changes and renames, applied to the open stores entry by entry.
#ifndef TAVO_ACCOUNT_DETAIL_USER_BATCH_H
#define TAVO_ACCOUNT_DETAIL_USER_BATCH_H

#include "account/detail/user_accounts.h"

#include <set>
#include <string>
#include <utility>
#include <vector>

namespace tavo {

// What the rest of the system has to follow up for an entry that was applied.
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
    explicit UserBatch(const TAVOUSERDB &db) : db_(db) {}

    // How an entry came out. A damaged store ends the batch: nothing of it may be kept.
    struct Outcome {
        int code = 0;
        bool damaged = false;
        bool duplicate = false;  // the old name was given before
        bool absent = false;     // the old name is no account
    };

    Outcome Apply(const char *old_name, const TAVOUSER *user);

    const std::vector<DoneUser> &Done() const { return done_; }

  private:
    Outcome Store(const char *old_name, const TAVOUSER &user, int uid_code, bool uid_is_chosen);

    const TAVOUSERDB &db_;
    const HashMethod method_ = ConfiguredHashMethod();
    std::set<std::string> old_keys_;
    std::vector<DoneUser> done_;
};

}  // namespace tavo

#endif
