// How the log names what follows a change of accounts and could not be done. It is tried again by each later change.
#ifndef TAVO_ACCOUNT_DETAIL_FOLLOW_UP_LOG_H
#define TAVO_ACCOUNT_DETAIL_FOLLOW_UP_LOG_H

#include "account/detail/commit_marker.h"
#include "core/detail/result.h"
#include "core/detail/where.h"

namespace tavo {

struct FollowUpFailure {
    unsigned target = kAccountFile;  // the neighbour; kAccountFile: home folders
    const HomeStep *home = nullptr;  // which; nullptr: those of deleted users that were put aside
    bool is_group = false;
    bool is_removal = false;
    Code code = 0;
};

// At the place of the function that changes the accounts. Folders that could not be removed and a missing settings file
// of the Apple service also go into the error state: callers know them from there.
void LogFollowUp(const FollowUpFailure &failure, Where where) noexcept;

}  // namespace tavo

#endif
