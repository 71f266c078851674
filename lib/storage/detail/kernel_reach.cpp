// How large a device may be for this system's kernel.
#include "storage/detail/kernel_reach.h"

#include "storage/detail/array_level.h"
#include "storage/detail/disk_size.h"

#include <algorithm>
#include <string_view>

#include <sys/utsname.h>

namespace tavo {
namespace {

constexpr uint64_t kReach = uint64_t{1} << 44;  // 2^32 pages of 4 KiB

// "armv8l" is what a 64-bit kernel answers to programs of 32 bits.
bool IsNarrowKernel() noexcept
{
    struct utsname system;
    if (::uname(&system) != 0)
        return false;
    const std::string_view machine = system.machine;
    return !machine.ends_with("64") && machine != "armv8l";
}

// In bytes; 0 where it cannot be read.
uint64_t SizeOf(const std::string &path)
{
    const Fd device = OpenFd(path.c_str(), O_RDONLY);
    uint64_t bytes = 0;
    return device && AskSize(device, bytes) ? bytes : 0;
}

uint64_t SizeOfAll(const TLIBSZLIST &devices)
{
    uint64_t bytes = 0;
    for (int i = 0; i < devices.nItem; ++i)
        bytes += SizeOf(devices.pszItem[i]);
    return bytes;
}

// Of each member, as the smallest one allows.
uint64_t MemberSize(const ArrayPlan &plan)
{
    uint64_t least = plan.member_limit;
    for (int i = 0; plan.members && i < plan.members->nItem; ++i) {
        const uint64_t bytes = SizeOf(plan.members->pszItem[i]);
        if (bytes > 0)
            least = least > 0 ? std::min(least, bytes) : bytes;
    }
    return least;
}

uint64_t ArraySize(const ArrayPlan &plan)
{
    if (HasNoRedundancy(plan.level))
        return plan.members ? SizeOfAll(*plan.members) : 0;
    const auto slots = static_cast<uint64_t>(std::max(plan.slots, 0));
    // Of three slots a RAID 10 of two copies holds one and a half.
    if (plan.level == RAID_LEVEL_10)
        return MemberSize(plan) * slots / 2;
    const int parity = RAIDParityDiskCount(plan.level, plan.slots);
    return parity < 0 || parity > plan.slots ? 0 : MemberSize(plan) * (slots - static_cast<uint64_t>(parity));
}

}  // namespace

std::string BeyondReach(const std::string &what, uint64_t bytes)
{
    if (bytes <= kReach || !IsNarrowKernel())
        return "";
    return what + " is larger than the 16 TiB of one device that this system can reach";
}

std::string DeviceBeyondReach(const std::string &path)
{
    return IsNarrowKernel() ? BeyondReach(path, SizeOf(path)) : "";
}

std::string GroupBeyondReach(const std::string &group, const TLIBSZLIST &devices)
{
    return IsNarrowKernel() ? BeyondReach(group, SizeOfAll(devices)) : "";
}

std::string ArrayBeyondReach(const std::string &array, const ArrayPlan &plan)
{
    if (!IsNarrowKernel())
        return "";
    for (int i = 0; plan.members && i < plan.members->nItem; ++i) {
        std::string sentence = DeviceBeyondReach(plan.members->pszItem[i]);
        if (!sentence.empty())
            return sentence;
    }
    return BeyondReach(array, ArraySize(plan));
}

std::string LongerArrayBeyondReach(const std::string &array, const std::string &member)
{
    return IsNarrowKernel() ? BeyondReach(array, SizeOf(array) + SizeOf(member)) : "";
}

}  // namespace tavo
