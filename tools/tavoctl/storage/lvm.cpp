// tavoctl lvm: physical volumes, their groups and the volumes that fill them.
#include "tavo_lvm.h"

#include "families.h"
#include "frame/containers.h"
#include "storage/device.h"
#include "storage/volume_groups.h"

namespace tavoctl {
namespace {

constexpr char vg_help[] = "its name, vg1 or /dev/vg1";

struct PvFacts {
    LVMPV pv;
    std::string volume;  // that fills the group; empty when there is none
};

constexpr Column<PvFacts> pv_columns[] = {
    {"device", [](const PvFacts &p) { return DeviceName(p.pv.szPv); }},
    {"size", [](const PvFacts &p) { return SizeOf(p.pv.szPv); }},
    {"group", [](const PvFacts &p) { return Maybe(DeviceName(p.pv.szVg)); }},
    {"devices", [](const PvFacts &p) { return *p.pv.szVg ? std::optional<int>(p.pv.nPv) : std::nullopt; },
     "of the group"},
    {"volume", [](const PvFacts &p) { return Maybe(p.volume); }, "that fills the group"},
    {"use", [](const PvFacts &p) { return Maybe(p.volume.empty() ? "" : UseOf(p.volume)); },
     "why it must not be removed"},
    {"uuid", [](const PvFacts &p) { return Maybe(p.pv.szUuid); }, "of the group"},
};

std::vector<std::string> VgNames()
{
    std::vector<std::string> names;
    for (const LVMPV &pv : PhysicalVolumes()) {
        const std::string name = DeviceName(pv.szVg);
        if (!name.empty() && (names.empty() || names.back() != name))
            names.push_back(name);
    }
    return names;
}

std::string VgName(const std::string &word)
{
    return word.starts_with("/dev/") ? word.substr(5) : word;
}

std::string VgPath(const std::string &word)
{
    return "/dev/" + VgName(word);
}

constexpr ArgumentKind vg_kind = {
    .name = "volume group",
    .allowed = "a name that begins with vg, vg1 or /dev/vg1",
    .valid =
        [](const std::string &word) {
            const std::string name = VgName(word);
            return name.starts_with("vg") && name.find("..") == name.npos &&
                   name.find_first_not_of("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_.+-") ==
                       name.npos;
        },
    .candidates = VgNames,
    .sample = "vg77",
    .wrong = "data",
};

Action LvmList(Arguments &in)
{
    const auto wake = in.Flag("--wake", "read them although that wakes a disk");
    return [=](Call &call) {
        RefuseToWakeAny(*wake, "list the physical volumes");
        std::vector<PvFacts> facts;
        for (const LVMPV &pv : PhysicalVolumes()) {
            char path[256];
            const bool has = *pv.szVg && LVMGetLVPath(pv.szPv, path, sizeof path) == 1;
            facts.push_back({pv, has ? path : ""});
        }
        call.List(pv_columns, facts);
    };
}

Action LvmCreate(Arguments &in)
{
    const auto group = in.Text("GROUP", vg_kind, vg_help);
    const auto words = in.Texts("DEVICE", device_kind, "usually an array, md2 or /dev/md2");
    const auto volume = in.Option("--volume", "NAME", any_text, "of the volume (lv)");
    return [=](Call &call) {
        const std::string path = VgPath(*group);
        const std::string attempted = "make the volume group " + path;
        RefuseWithoutLvm(attempted);
        const std::vector<std::string> paths = DevicePaths(*words);
        LVMVG present;
        FailIf(LVMVgSBGet(path.c_str(), &present) == 1, attempted, "it is there already");
        RefuseUsed(paths, attempted);
        RefuseGrouped(paths, attempted);
        RefuseTooLarge(SizeOfAll(paths), attempted);
        call.Change(path, "devices", {}, paths);
        call.Change(path, "volume", {}, volume->value_or("lv"));
        if (call.Proceed("Lose what is on " + Joined(paths, ", ") + "?"))
            Must(LVMCreate(StringList(paths).Get(), path.c_str(), volume->value_or("lv").c_str(), nullptr, 0) == 0,
                 attempted, log_hint);
    };
}

Action LvmRemove(Arguments &in)
{
    const auto group = in.Text("GROUP", vg_kind, vg_help);
    return [=](Call &call) {
        const std::string path = VgPath(*group);
        const std::string attempted = "remove the volume group " + path;
        ReadVg(path, attempted);
        const std::vector<std::string> devices = DevicesOf(path);
        RefuseUsedGroup(path, attempted);
        call.Change(path, "devices", devices, {});
        if (!call.Proceed("Lose " + path + " and what is on it?"))
            return;
        Must(LVMRemove(path.c_str(), "lv") == 0 && LVMVgRemove(path.c_str()) == 0, attempted, log_hint);
        for (const std::string &device : devices)
            Must(LVMPvRemove(device.c_str()) == 0, "make " + device + " no physical volume any more", log_hint);
    };
}

Action LvmRename(Arguments &in)
{
    const auto group = in.Text("GROUP", vg_kind, vg_help);
    const auto new_name = in.Text("NAME", vg_kind, "the new name; it begins with vg");
    return [=](Call &call) {
        const std::string path = VgPath(*group);
        const std::string name = VgName(*new_name);
        const std::string attempted = "rename the volume group " + path;
        ReadVg(path, attempted);
        call.Change(path, "name", DeviceName(path), name);
        if (call.Proceed())
            Must(LVMVgRename(path.c_str(), nullptr, name.c_str()) == 0, attempted, log_hint);
    };
}

Action LvmExpand(Arguments &in)
{
    const auto group = in.Text("GROUP", vg_kind, vg_help);
    return [=](Call &call) {
        const std::string path = VgPath(*group);
        const std::string attempted = "expand the volume group " + path;
        const VolumeGroup record = ReadVgInfo(path, attempted);
        call.Change(path, "size", {}, "the whole of its devices");
        if (call.Proceed())
            Must(LVMPvExpand(record.get()) == 0, attempted, log_hint);
    };
}

}  // namespace

void AddLvm(Program &program)
{
    Family &lvm = program.Add("lvm", "Volume groups on the arrays");
    lvm.Add("list", reads, Answer::List(pv_columns), LvmList,
            R"(Lists the physical volumes with their group and its volume, and
where that is mounted. While a disk is in standby nothing is read unless --wake is given.

tavoctl lvm list)");
    lvm.Add("create", changes | destroys, LvmCreate, R"(Makes physical volumes of DEVICEs, a group of them, and
the volume that fills it. What is on them is lost; one that is in use is refused.

tavoctl lvm create vg1 md2
tavoctl lvm create --yes --volume lv vg1 md2 md3)");
    lvm.Add("remove", changes | destroys, LvmRemove, R"(Removes a group with its volumes and its physical volumes.
What is on it is lost; one that is in use is refused.

tavoctl lvm remove vg1)");
    lvm.Add("rename", changes, LvmRename, R"(Renames a group.

tavoctl lvm rename vg1 vg2)");
    lvm.Add("expand", changes, LvmExpand, R"(Has the physical volumes of a group use the whole of their devices,
after an array has grown. The volume and its file system are not touched.

tavoctl lvm expand vg1)");
}

}  // namespace tavoctl
