// Reads the environment's description of the root.
#include "support/appliance_root.h"

#include <cstdlib>

namespace test {

std::string_view RootForm()
{
    const char *form = std::getenv("TAVO_ROOT_FORM");
    return form ? form : "";
}

bool RootLacks(std::string_view word)
{
    const char *lacks = std::getenv("TAVO_ROOT_LACKS");
    if (RootForm().empty() || !lacks)
        return true;
    for (std::string_view left = lacks; !left.empty();) {
        const std::size_t comma = left.find(',');
        if (left.substr(0, comma) == word)
            return true;
        left.remove_prefix(comma == left.npos ? left.size() : comma + 1);
    }
    return false;
}

}  // namespace test
