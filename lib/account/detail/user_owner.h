// Owns a user record.
#ifndef TAVO_ACCOUNT_DETAIL_USER_OWNER_H
#define TAVO_ACCOUNT_DETAIL_USER_OWNER_H

#include "tavo_user.h"

namespace tavo {

class UserOwner {
  public:
    UserOwner() = default;
    ~UserOwner() { TAVOUserFree(user_); }
    UserOwner(const UserOwner &) = delete;
    UserOwner &operator=(const UserOwner &) = delete;

    TAVOUSER **Fill() noexcept { return &user_; }  // for functions that fill or refill a record
    const TAVOUSER *operator->() const noexcept { return user_; }

  private:
    TAVOUSER *user_ = nullptr;
};

}  // namespace tavo

#endif
