// The md driver's description of an open array and its members.
#ifndef TAVO_STORAGE_DETAIL_ARRAY_MEMBERS_H
#define TAVO_STORAGE_DETAIL_ARRAY_MEMBERS_H

#include "tavo_raid.h"

#include <linux/major.h>
#include <linux/raid/md_u.h>
#include <sys/ioctl.h>

namespace tavo {

// Requests that only the appliance's driver knows. Their numbers hold the sizes of packed arguments.
inline constexpr unsigned long kStatusRequest = 0x80040961;
inline constexpr unsigned long kSyncStatusRequest = 0x80140960;
static_assert(sizeof(RAIDPROGRESS) == 20 && sizeof(int) == 4);

void FreeMembers(RAIDMEMBER *members) noexcept;

// RAID_MEMBER_ of the kernel's state bits.
int MemberState(int kernel_state, bool has_no_redundancy);

// The members as heap nodes, in the order of the kernel's numbers; one whose disk was pulled by the name that md keeps.
// False when memory ran out.
bool ReadMembers(int fd, int array_number, const mdu_array_info_t &array, RAIDMEMBER **members);

// Returns whether a word of sync_action means that the array's members are not all up to date; a scrub ("check") does
// not.
bool IsRebuildAction(const char *action);

}  // namespace tavo

#endif
