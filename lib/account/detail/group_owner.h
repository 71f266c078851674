// Owns a group record.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_OWNER_H
#define TAVO_ACCOUNT_DETAIL_GROUP_OWNER_H

#include "tavo_group.h"

namespace tavo {

class GroupOwner {
  public:
    GroupOwner() = default;
    ~GroupOwner() { TAVOGroupFree(group_); }
    GroupOwner(const GroupOwner &) = delete;
    GroupOwner &operator=(const GroupOwner &) = delete;

    TAVOGROUP **Fill() noexcept { return &group_; }  // for functions that fill or refill a record
    const TAVOGROUP *operator->() const noexcept { return group_; }

  private:
    TAVOGROUP *group_ = nullptr;
};

}  // namespace tavo

#endif
