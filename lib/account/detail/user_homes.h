// The home folders of users that are added, renamed and deleted, as steps of a change.
#ifndef TAVO_ACCOUNT_DETAIL_USER_HOMES_H
#define TAVO_ACCOUNT_DETAIL_USER_HOMES_H

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

enum class HomeResult {
    done,       // also when there is nothing to do any more
    failed,     // errno says why
    elsewhere,  // the folder is on another file system: it is moved after the locks are released
};

// One step by one rename or mkdir.
HomeResult TakeHomeStep(const HomeStep &step, const std::vector<std::string> &stages);

// The slow steps: moves a folder from another file system, removes a staging folder with its contents (false when that
// fails; true when another process is doing it, with `theirs`).
bool MoveHomeElsewhere(const HomeStep &step, const std::vector<std::string> &stages);
bool RemoveStage(const std::string &path, bool &theirs);

}  // namespace tavo

#endif
