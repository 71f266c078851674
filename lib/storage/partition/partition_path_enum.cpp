// Lists the paths of disks and partitions.
#include "tavo_disk.h"
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/text_fields.h"
#include "storage/detail/device_name.h"
#include "storage/detail/proc_partitions.h"

#include <string>

namespace {

bool Passes(const PARTITIONFILTER &filter, const std::string &name)
{
    if (filter.szPrefix && !name.starts_with(filter.szPrefix))
        return false;
    if (filter.fContainer == 0)
        return true;
    int kind = 0;
    if (DiskContainerGet(name.c_str(), &kind) != 0) {
        LogError("%s:%d Failed to parsing device: %s", name);
        return false;
    }
    return (kind & filter.fContainer) != 0;
}

}  // namespace

extern "C" int PartitionPathEnum(const PARTITIONFILTER *pFilter, TLIBSZLIST **ppList)
{
    if (!pFilter || !ppList || !*ppList) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    return Guard([&] {
        TLIBSzListSortItems(*ppList, TLIB_SZLIST_SORTED);
        tavo::PartitionsFile file;
        bool any = false;
        for (std::string_view line; file.Next(line);) {
            any = true;
            const size_t tokens = tavo::SplitFields(line).size();
            if (tokens != 4) {
                LogDebug("%s:%d Unexpected line: [%s]. Counts of token is [%d]", line, tokens);
                continue;
            }
            const auto row = tavo::ParsePartitionsRow(line);  // none for the heading, which has four tokens too
            if (!row || !Passes(*pFilter, std::string(row->name)))
                continue;
            if (TLIBSzListPush(ppList, std::string(tavo::kDev).append(row->name).c_str()) < 0)
                return -1;
        }
        if (file.Failure() != 0 || !any) {
            LogError("%s:%d There's no line in /proc/partitions");
            return -1;
        }
        return (*ppList)->nItem;
    });
}
