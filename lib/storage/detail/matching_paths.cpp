// The files whose paths match a shell pattern.
#include "storage/detail/matching_paths.h"

#include <memory>

#include <glob.h>

namespace tavo {

Result<std::vector<std::string>> MatchingPaths(const std::string &pattern)
{
    struct FreeGlob {
        void operator()(glob_t *found) const noexcept { ::globfree(found); }
    };
    glob_t found = {};
    const int error = ::glob(pattern.c_str(), 0, nullptr, &found);
    const std::unique_ptr<glob_t, FreeGlob> owner(&found);
    if (error == GLOB_NOMATCH)
        return std::vector<std::string>();
    if (error != 0)
        return error == GLOB_NOSPACE ? ERR_OUT_OF_MEMORY : ERR_OPEN_FAILED;
    return std::vector<std::string>(found.gl_pathv, found.gl_pathv + found.gl_pathc);
}

}  // namespace tavo
