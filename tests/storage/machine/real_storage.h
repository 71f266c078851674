// What tests on the machine's own disks share. After each case the machine is as it was: no arrays or volumes, disks empty.
#ifndef TESTS_STORAGE_MACHINE_REAL_STORAGE_H
#define TESTS_STORAGE_MACHINE_REAL_STORAGE_H

#include "support/container_text.h"
#include "support/eventually.h"
#include "support/machine.h"

#include "tavo_disk.h"
#include "tavo_lvm.h"
#include "tavo_partition.h"
#include "tavo_raid.h"

#include <memory>
#include <string>
#include <vector>

#include <unistd.h>

namespace test {

class StorageTest : public MachineTest {
  protected:
    void TearDown() override
    {
        if (!OnMachine())
            return;
        Shell("grep -E ' /(mnt|volume)' /proc/mounts | while read -r source place rest; do umount $place; done");
        Told("/usr/lib/tavo-machine/reset; rm -rf /dev/vg* /volume*");
    }
};

using Array = std::unique_ptr<RAIDINFO, decltype(&RAIDInfoFree)>;

// Empty where there is no such array.
inline Array ReadArray(const std::string &path)
{
    RAIDINFO *info = nullptr;
    if (RAIDInfoGet(path.c_str(), &info) != 1)
        info = nullptr;
    return {info, RAIDInfoFree};
}

inline int StatusOf(const std::string &path)
{
    const Array array = ReadArray(path);
    return array ? array->nStatus : 0;
}

// The paths of the members in one of these states.
inline std::vector<std::string> MembersOf(const std::string &path, int states)
{
    std::vector<std::string> members;
    const Array array = ReadArray(path);
    for (const RAIDMEMBER *member = array ? array->pMembers : nullptr; member; member = member->pNext) {
        if (member->nState & states)
            members.emplace_back(member->szPath);
    }
    return members;
}

struct Making {
    std::string path;
    int level;
    std::vector<std::string> members;
    int slots = 0;  // 0: as many as members
    int spares = 0;
    uint64_t mib = 0;  // of each member
    bool sync = true;
};

inline int Make(const Making &making)
{
    const List members = MakeList(making.members);
    RAIDREQUEST request = {};
    request.szPath = making.path.c_str();
    request.fLevel = making.level;
    request.nSpare = making.spares;
    request.nSlot = making.slots ? making.slots : static_cast<int>(making.members.size()) - making.spares;
    request.cbArray = making.mib << 20;
    request.pslMembers = members.get();
    request.fSync = making.sync ? 1 : 0;
    return RAIDCreate(&request);
}

inline bool BecomesNormal(const std::string &path)
{
    return Eventually([&] {
        const Array array = ReadArray(path);
        return array && array->nStatus == RAID_STATUS_NORMAL && !array->fRebuilding;
    });
}

// The disks in bays 1 to count, replaced by empty ones of that size.
inline void PlugLargeDisks(int count, int mib)
{
    for (int bay = 1; bay <= count; ++bay) {
        Happen("pull " + std::to_string(bay));
        Happen("plug " + std::to_string(bay) + " --blank " + std::to_string(mib));
    }
}

// As when the kernel finds that a member does not answer.
inline void FailMember(const std::string &array, const std::string &member)
{
    Told("echo faulty >/sys/block/" + array.substr(5) + "/md/dev-" + member.substr(5) + "/state");
}

inline std::string Disk(int bay)
{
    return std::string("/dev/sd") + static_cast<char>('a' + bay - 1);
}

}  // namespace test

#endif
