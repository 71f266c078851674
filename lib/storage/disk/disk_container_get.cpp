// Finds where a disk sits.
#include "tavo_disk.h"

#include "core/detail/ascii.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/model_setting.h"
#include "storage/detail/device_name.h"

#include <optional>

namespace {

constexpr size_t kShortest = 3;
constexpr size_t kLongest = 15;
constexpr char kLastBay = 'j';

constexpr bool EndsName(char c)
{
    return c == 0 || c == '\n' || tavo::IsDigit(c);
}

std::optional<int> KindOf(const std::string &name, char port, char next)
{
    if (tavo::IsLower(port) && tavo::IsLower(next))
        return DISK_CONTAINER_UNIT;
    if (!tavo::IsLower(port) || !EndsName(next))
        return std::nullopt;
    if (tavo::ModelSetting("esatadiskname") == name)
        return DISK_CONTAINER_ESATA;
    return port <= kLastBay ? DISK_CONTAINER_INTERNAL : DISK_CONTAINER_EXTERNAL;
}

}  // namespace

extern "C" int DiskContainerGet(const char *szPath, int *pKind)
{
    const std::string_view given = szPath ? tavo::WithoutDev(szPath) : std::string_view();
    if (!pKind || !given.starts_with("sd") || given.size() < kShortest) {
        LogError("%s:%d bad paramters");
        return -1;
    }
    return Guard([&] {
        const std::string name(given.substr(0, kLongest));
        const char port = name[2];
        const char next = name.c_str()[3];
        LogDebug("%s:%d szShortDev: %s, port: %c, [%d]", name, std::string_view(&port, 1), port - 'a' + 1);
        const std::optional<int> kind = KindOf(name, port, next);
        if (!kind) {
            LogError("%s:%d unknown device: %s, %s, %c, %c", szPath, name, std::string_view(&port, 1),
                     std::string_view(&next, 1));
            return -1;
        }
        *pKind = *kind;
        return 0;
    });
}
