// The files whose paths match a shell pattern.
#ifndef TAVO_STORAGE_DETAIL_MATCHING_PATHS_H
#define TAVO_STORAGE_DETAIL_MATCHING_PATHS_H

#include "core/detail/result.h"

#include <string>
#include <vector>

namespace tavo {

// In the order of their names; none is not a failure. ERR_OUT_OF_MEMORY or ERR_OPEN_FAILED.
Result<std::vector<std::string>> MatchingPaths(const std::string &pattern);

}  // namespace tavo

#endif
