// Members of arrays whose disks were pulled: the kernel's names for them.
#ifndef TAVO_STORAGE_DETAIL_MEMBER_NODE_H
#define TAVO_STORAGE_DETAIL_MEMBER_NODE_H

#include <string>
#include <string_view>
#include <vector>

namespace tavo {

// The name that the kernel gives to a SCSI disk or partition of that device number ("sdb3" for 8:19); empty for other
// numbers.
std::string ScsiName(unsigned major_number, unsigned minor_number);

// The names by which md holds the members of an array, from /sys/block/mdN/md/dev-*, sorted.
std::vector<std::string> MemberNames(int array);

// Returns whether md holds a member by that name, and whether it counts it as failed.
bool IsMemberName(int array, std::string_view name);
bool IsFaulty(int array, std::string_view name);

}  // namespace tavo

#endif
