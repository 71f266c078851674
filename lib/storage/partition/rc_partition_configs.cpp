// Asks the partitioning tool for one partition.
#include "tavo_partition.h"

#include "core/detail/command_output.h"
#include "core/detail/guard.h"
#include "core/detail/shell_command.h"
#include "storage/detail/device_name.h"
#include "storage/detail/sfdisk_line.h"

extern "C" int64_t RCPartitionConfigs(int nPartition, const char *szDisk, int64_t *pnStart, uint32_t *pnType)
{
    if (!szDisk || nPartition <= 0)
        return -1;
    const std::string_view name = tavo::WithoutDev(szDisk);
    if (!tavo::IsDeviceName(name))
        return -1;
    return Guard([&]() -> int64_t {
        const auto command = tavo::ShellCommand("/sbin/sfdisk -l -uS -N%d /dev/%s", nPartition, name);
        if (!command)
            return -1;
        tavo::CommandOutput output(*command);
        std::string line;
        const auto geometry = output.Next(line) ? tavo::ParseSfdiskLine(line) : std::nullopt;
        if (!geometry)
            return -1;
        if (pnStart)
            *pnStart = geometry->start;
        if (pnType)
            *pnType = geometry->type;
        return geometry->count;
    });
}
