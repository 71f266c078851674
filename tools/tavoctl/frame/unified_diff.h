// The difference between two texts as patch(1) reads it.
#ifndef TAVOCTL_UNIFIED_DIFF_H
#define TAVOCTL_UNIFIED_DIFF_H

#include <string>
#include <string_view>

namespace tavoctl {

// "" when they are equal. The names go to the two header lines.
std::string UnifiedDiff(std::string_view before, std::string_view after, const std::string &name_before,
                        const std::string &name_after);

}  // namespace tavoctl

#endif
