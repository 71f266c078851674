// Arrays that do not run, as the superblocks of their members describe them.
#ifndef TAVOCTL_STOPPED_ARRAYS_H
#define TAVOCTL_STOPPED_ARRAYS_H

#include "tavo_raid.h"

#include <memory>
#include <string>
#include <vector>

namespace tavoctl {

struct StoppedMember {
    std::string path;
    int slot;  // -1: a spare
    int events;
};

struct StoppedArray {
    std::string path;  // "/dev/md2"; empty when its name holds no number
    std::string uuid;
    int level;
    int slots;
    std::vector<StoppedMember> members;

    // How many slots have a member that took part in all that was written.
    int UpToDate() const;
    // How many of them it takes to have all data.
    int Needed() const;
    bool OnUsb() const;
    // "/dev/sda3: slot 0, 1204 events", a member each.
    std::vector<std::string> Describe() const;
    // As an array that runs is described; its status is 0.
    std::shared_ptr<const RAIDINFO> Record() const;
};

// Reads all disks and partitions that are not members of a running array. Throws a Failure when one of the disks is in
// standby, unless wake is set.
std::vector<StoppedArray> StoppedArrays(bool wake);

}  // namespace tavoctl

#endif
