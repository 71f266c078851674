// tavoctl lvm: physical volumes, their groups and the volumes that fill them.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/table.h"
#include "storage/device.h"

#include "tavo_lvm.h"

#include <filesystem>
#include <memory>
#include <string_view>

namespace tavoctl {
namespace {

constexpr char group_help[] = "its name, vg1 or /dev/vg1";

struct FreeVolumes {
    void operator()(LVMPVLIST *list) const { LVMPvSBListFree(list); }
};

std::vector<LVMPV> PhysicalVolumes()
{
    LVMPVLIST *list = nullptr;
    if (LVMPvSBEnum(&list) < 0)
        throw LibraryFailure("list the physical volumes", log_hint);
    const std::unique_ptr<LVMPVLIST, FreeVolumes> owner(list);
    std::vector<LVMPV> volumes;
    for (const LVMPVLIST *node = list; node; node = node->pNext)
        volumes.push_back(node->pv);
    return volumes;
}

std::vector<std::string> GroupNames()
{
    std::vector<std::string> names;
    LVMPVLIST *list = nullptr;
    if (LVMPvSBEnum(&list) > 0) {
        const std::unique_ptr<LVMPVLIST, FreeVolumes> owner(list);
        for (const LVMPVLIST *node = list; node; node = node->pNext) {
            const std::string name = DeviceName(node->pv.szVg);
            if (!name.empty() && (names.empty() || names.back() != name))
                names.push_back(name);
        }
    }
    return names;
}

std::string GroupPath(const std::string &word)
{
    const std::string name = word.starts_with("/dev/") ? word.substr(5) : word;
    const bool plain =
        name.starts_with("vg") && name.find("..") == name.npos &&
        name.find_first_not_of("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_.+-") == name.npos;
    if (!plain)
        throw UsageFailure("use " + word, "it is no name of a volume group", "a name begins with vg");
    return "/dev/" + name;
}

void RefuseWithoutLvm(const std::string &attempted)
{
    if (LVMIsSupport() != 1)
        throw Failure{.attempted = attempted, .reason = "this model has no RAID and no volumes"};
}

// Throws a Failure when there is no such group.
LVMVG ReadGroup(const std::string &path, const std::string &attempted)
{
    LVMVG group;
    const int found = LVMVgSBGet(path.c_str(), &group);
    if (found < 0)
        throw LibraryFailure(attempted, log_hint);
    if (found == 0)
        throw NotFound(attempted, ERR_NO_VOLUME_ID, "tavoctl lvm list shows what is there");
    return group;
}

// Throws a Failure when a volume of the group is in use.
void RefuseUsedGroup(const std::string &path, const std::string &attempted)
{
    std::error_code none;
    for (const auto &volume : std::filesystem::directory_iterator(path, none)) {
        if (const std::string use = UseOf(volume.path()); !use.empty())
            throw Failure{.attempted = attempted, .reason = use, .hint = "free it first", .status = exit_busy};
    }
}

class LvmList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists the physical volumes with their group and its volume, and where that is "
                                      "mounted. While a disk is in standby nothing is read unless --wake is given.",
                                      "tavoctl lvm list"};

    void Declare(Arguments &arguments) override
    {
        arguments.Flag("--wake", wake_, "read them although that wakes a disk");
    }

    int Run(const Call &call) override
    {
        RefuseToWakeAny(wake_, "list the physical volumes");
        Table table({"device", "size", "group", "devices", "volume", "use", "uuid"});
        for (const LVMPV &pv : PhysicalVolumes()) {
            char path[256];
            const bool has = *pv.szVg && LVMGetLVPath(pv.szPv, path, sizeof path) == 1;
            uint64_t sectors = 0;
            const bool sized = DiskSizeGet(pv.szPv, &sectors) == 1;
            table.Add({DeviceName(pv.szPv), sized ? Cell(Bytes{sectors * 512}) : Cell(), Known(DeviceName(pv.szVg)),
                       *pv.szVg ? Cell(int{pv.nPv}) : Cell(), has ? Cell(path) : Cell(),
                       has ? Known(UseOf(path)) : Cell(), Known(pv.szUuid)});
        }
        call.Print(table);
        return exit_done;
    }

  private:
    bool wake_ = false;
};

class LvmCreate : public Verb {
  public:
    static constexpr VerbInfo info = {"create", changes | destroys,
                                      "Makes physical volumes of DEVICEs, a group of them, and the volume that fills "
                                      "it. What is on them is lost; one that "
                                      "is in use is refused.",
                                      "tavoctl lvm create vg1 md2\n"
                                      "tavoctl lvm create --yes --volume lv vg1 md2 md3"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("GROUP", group_, group_help);
        arguments.Texts("DEVICE", words_, "usually an array, md2 or /dev/md2", 1, DeviceNames);
        arguments.Option("--volume", "NAME", volume_, "of the volume (lv)");
    }

    int Run(const Call &call) override
    {
        const std::string path = GroupPath(group_);
        const std::string attempted = "make the volume group " + path;
        RefuseWithoutLvm(attempted);
        const std::vector<std::string> paths = DevicePaths(words_);
        LVMVG group;
        if (LVMVgSBGet(path.c_str(), &group) == 1)
            throw Failure{.attempted = attempted, .reason = "it is there already"};
        RefuseUsed(paths, attempted);
        for (const LVMPV &pv : PhysicalVolumes()) {
            for (const std::string &device : paths) {
                if (*pv.szVg && device == pv.szPv)
                    throw Failure{.attempted = attempted,
                                  .reason = device + " belongs to " + pv.szVg,
                                  .hint = "remove that first",
                                  .status = exit_busy};
            }
        }
        call.Confirm("Lose what is on " + Listed(paths) + "?");
        if (LVMCreate(StringList(paths).Get(), path.c_str(), volume_.c_str(), nullptr, 0) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }

  private:
    std::string group_;
    std::vector<std::string> words_;
    std::string volume_ = "lv";
};

// A verb about a group that is there.
class GroupVerb : public Verb {
  public:
    void Declare(Arguments &arguments) override { arguments.Text("GROUP", group_, group_help, GroupNames); }

  protected:
    std::string group_;
};

class LvmRemove : public GroupVerb {
  public:
    static constexpr VerbInfo info = {"remove", changes | destroys,
                                      "Removes a group with its volumes and its physical volumes. What is on it is "
                                      "lost; one that is in use is refused.",
                                      "tavoctl lvm remove vg1"};

    int Run(const Call &call) override
    {
        const std::string path = GroupPath(group_);
        const std::string attempted = "remove the volume group " + path;
        RefuseWithoutLvm(attempted);
        ReadGroup(path, attempted);
        std::vector<std::string> devices;
        for (const LVMPV &pv : PhysicalVolumes()) {
            if (path == pv.szVg)
                devices.emplace_back(pv.szPv);
        }
        RefuseUsedGroup(path, attempted);
        call.Confirm("Lose " + path + " and what is on it?");
        if (LVMRemove(path.c_str(), "lv") != 0 || LVMVgRemove(path.c_str()) != 0)
            throw LibraryFailure(attempted, log_hint);
        for (const std::string &device : devices) {
            if (LVMPvRemove(device.c_str()) != 0)
                throw LibraryFailure("make " + device + " no physical volume any more", log_hint);
        }
        return exit_done;
    }
};

class LvmRename : public GroupVerb {
  public:
    static constexpr VerbInfo info = {"rename", changes, "Renames a group.", "tavoctl lvm rename vg1 vg2"};

    void Declare(Arguments &arguments) override
    {
        GroupVerb::Declare(arguments);
        arguments.Text("NAME", name_, "the new name; it begins with vg");
    }

    int Run(const Call &) override
    {
        const std::string path = GroupPath(group_);
        const std::string attempted = "rename the volume group " + path;
        RefuseWithoutLvm(attempted);
        const std::string name = DeviceName(GroupPath(name_));
        ReadGroup(path, attempted);
        if (LVMVgRename(path.c_str(), nullptr, name.c_str()) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }

  private:
    std::string name_;
};

class LvmExpand : public GroupVerb {
  public:
    static constexpr VerbInfo info = {
        "expand", changes,
        "Has the physical volumes of a group use the whole of their devices, after an array "
        "has grown. The volume and its file system are not touched.",
        "tavoctl lvm expand vg1"};

    int Run(const Call &) override
    {
        const std::string path = GroupPath(group_);
        const std::string attempted = "expand the volume group " + path;
        RefuseWithoutLvm(attempted);
        const LVMVG group = ReadGroup(path, attempted);
        const std::unique_ptr<LVMVGINFO, void (*)(LVMVGINFO *)> record(LVMVgInfoAlloc(), LVMVgInfoFree);
        if (!record || LVMVgSB2Info(&group, record.get()) != 0)
            throw LibraryFailure(attempted, log_hint);
        if (record->nPv == 0)
            throw Failure{.attempted = attempted, .reason = "it has no physical volumes"};
        if (LVMPvExpand(record.get()) != 0)
            throw LibraryFailure(attempted, log_hint);
        return exit_done;
    }
};

}  // namespace

void AddLvm(Program &program)
{
    Family &lvm = program.Add("lvm", "Volume groups on the arrays");
    lvm.Add<LvmList>();
    lvm.Add<LvmCreate>();
    lvm.Add<LvmRemove>();
    lvm.Add<LvmRename>();
    lvm.Add<LvmExpand>();
}

}  // namespace tavoctl
