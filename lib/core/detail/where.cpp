// Finds the module of a place in the source.
#include "core/detail/where.h"

#include <algorithm>
#include <iterator>
#include <string_view>

namespace tavo {
namespace {

// The base names of the library's files, sorted; the build writes them from its list of sources.
constexpr const char *kModules[] = {
#include "core/detail/modules.inc"
};

static_assert(std::is_sorted(std::begin(kModules), std::end(kModules),
                             [](std::string_view a, std::string_view b) { return a < b; }));

constexpr std::string_view Stem(std::string_view path)
{
    path.remove_prefix(path.rfind('/') + 1);
    return path.substr(0, path.rfind('.'));
}

}  // namespace

const char *ModuleOf(const Where &where) noexcept
{
    const std::string_view stem = Stem(where.file);
    const auto *const found =
        std::lower_bound(std::begin(kModules), std::end(kModules), stem,
                         [](std::string_view module, std::string_view key) { return module < key; });
    return found != std::end(kModules) && *found == stem ? *found : "unknown";
}

}  // namespace tavo
