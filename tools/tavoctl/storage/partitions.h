// The partitions of a disk, and the verbs that change them.
#ifndef TAVOCTL_PARTITIONS_H
#define TAVOCTL_PARTITIONS_H

#include "frame/verb.h"

namespace tavoctl {

int NumberOf(const std::string &partition);  // 3 of "/dev/sda3"

// In the order of the kernel's list.
std::vector<std::string> PartitionsOf(const std::string &disk);

Action PartitionMake(Arguments &in);
Action PartitionErase(Arguments &in);

}  // namespace tavoctl

#endif
