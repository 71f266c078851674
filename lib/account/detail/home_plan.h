// The home folders of users in the steps of a change.
#ifndef TAVO_ACCOUNT_DETAIL_HOME_PLAN_H
#define TAVO_ACCOUNT_DETAIL_HOME_PLAN_H

#include "account/detail/commit_marker.h"
#include "account/detail/user_batch.h"

#include <span>
#include <string>
#include <vector>

namespace tavo {

// Folders that could not be looked for, and are not planned.
struct HomePlan {
    std::vector<std::string> unknown;  // names of users; "" when it is about all of them
    int reason = 0;                    // errno

    void Unknown(std::string name);  // unless errno says that there is none
};

// The steps for users that were added and renamed: none unless the appliance has home folders. A folder is identified
// by its inode, so that a repeated or late step never moves another user's folder.
HomePlan PlanHomes(std::span<const DoneUser> done, Marker &marker);

// The steps for users that are deleted: their folders go to a staging folder on the same volume.
HomePlan PlanRemovals(std::span<const std::string> names, Marker &marker);

}  // namespace tavo

#endif
