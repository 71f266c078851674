// Disks, and the bays without one, with what can be found out without waking any.
#ifndef TAVOCTL_DISK_FACTS_H
#define TAVOCTL_DISK_FACTS_H

#include "frame/column.h"
#include "storage/arrays.h"
#include "storage/device.h"

#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

struct DiskFacts {
    std::string path, bay;
    bool there = true;  // else the bay is empty
    Power power = Power::unknown;
    bool asked = false;  // it may be read
    std::optional<std::string> model = {}, serial = {}, layout = {}, health = {};
    std::optional<Bytes> size = {};
    std::optional<int> temperature = {};
    std::vector<std::string> role = {};  // the arrays that it serves; of an empty bay, those that miss it

    std::optional<std::string> State() const;
};

// With wake, the disk is read although it may sleep.
DiskFacts DescribeDisk(const std::string &path, bool wake, const std::vector<Array> &arrays);

// By name.
std::vector<DiskFacts> NvmeDisks();

// All bays in their order, empty ones included, then the other disks by name, then NVMe disks.
std::vector<DiskFacts> AllDisks(bool wake, const std::vector<Array> &arrays);

}  // namespace tavoctl

#endif
