// Takes the steps of a change that are about home folders.
#ifndef TAVO_ACCOUNT_DETAIL_HOME_STEPS_H
#define TAVO_ACCOUNT_DETAIL_HOME_STEPS_H

#include "account/detail/commit_marker.h"

#include <string>
#include <vector>

namespace tavo {

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
