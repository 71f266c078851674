// tavoctl storage: from bay to volume in one tree.
#include "tavo_disk.h"

#include "families.h"
#include "storage/arrays.h"
#include "storage/disk_facts.h"
#include "storage/partitions.h"
#include "storage/storage_tree.h"
#include "storage/volumes.h"

#include <algorithm>
#include <set>

namespace tavoctl {
namespace {

struct Node {
    std::string name, kind;
    std::vector<std::string> parents = {};
    std::optional<Bytes> size = {}, available = {};
    std::optional<std::string> bay = {}, model = {}, serial = {}, state = {}, filesystem = {}, mount = {};
};

constexpr Column<Node> node_columns[] = {
    {"name", field<&Node::name>},
    {"kind", field<&Node::kind>, "bay (an empty one), disk, partition, array, group or volume"},
    {"parents", field<&Node::parents>, "the names of what it is on", in_details},
    {"bay", field<&Node::bay>},
    {"model", field<&Node::model>, "", in_details},
    {"serial", field<&Node::serial>, "as on the label of the disk"},
    {"size", field<&Node::size>},
    {"state", field<&Node::state>, "of a member, an array, a volume, a disk"},
    {"filesystem", field<&Node::filesystem>},
    {"mount", field<&Node::mount>, "where it is mounted"},
    {"available", field<&Node::available>, "room for users"},
};

// The rows of the tree, each after the one that it is below.
class Tree {
  public:
    explicit Tree(bool all) : arrays_(ReadArrays()), volumes_(ReadVolumes(all)), mounts_(Mounts()) {}

    Table Draw()
    {
        for (const DiskFacts &disk : AllDisks(false, arrays_))
            disk.there ? AddDisk(disk) : AddEmptyBay(disk);
        // Arrays and volumes that are only on missing disks.
        for (const Array &array : arrays_)
            AddArray(*array, -1);
        for (const Volume &volume : volumes_)
            if (!shown_.contains(volume.group))
                AddGroup(volume.group, -1);
        Table table(Facts(node_columns));
        for (std::size_t i = 0; i < nodes_.size(); ++i)
            table.Add(Mapped(node_columns, [&](const Column<Node> &column) { return column.read(nodes_[i]); }),
                      above_[i]);
        return table;
    }

  private:
    int Add(Node node, int above)
    {
        nodes_.push_back(std::move(node));
        above_.push_back(above);
        return static_cast<int>(nodes_.size()) - 1;
    }

    static std::string MemberState(int state)
    {
        return state == RAID_MEMBER_ACTIVE ? "active" : state == RAID_MEMBER_SPARE ? "spare" : "failed";
    }

    // The array that a device is a member of, and as what.
    std::pair<const RAIDINFO *, const RAIDMEMBER *> ArrayOf(const std::string &path) const
    {
        for (const Array &array : arrays_)
            for (const RAIDMEMBER *member = array->pMembers; member; member = member->pNext)
                if (path == member->szPath)
                    return {array.get(), member};
        return {nullptr, nullptr};
    }

    void AddEmptyBay(const DiskFacts &bay)
    {
        const int row = Add({.name = DeviceName(bay.path), .kind = "bay", .bay = bay.bay, .state = bay.State()}, -1);
        for (const Array &array : arrays_)
            for (const std::string &member : Members(*array, ~0))
                if (member.starts_with(bay.path))
                    Add({.name = DeviceName(member),
                         .kind = "partition",
                         .parents = {DeviceName(bay.path)},
                         .state = "gone from " + DeviceName(array->szPath)},
                        row);
    }

    void AddDisk(const DiskFacts &disk)
    {
        Node node = {.name = DeviceName(disk.path),
                     .kind = "disk",
                     .size = disk.size,
                     .bay = disk.bay,
                     .model = disk.model,
                     .serial = disk.serial,
                     .state = disk.State()};
        const std::string name = node.name;
        LookAt(node, disk.path);
        const int row = Add(std::move(node), -1);
        AddArrayOf(disk.path, row);
        for (const std::string &partition : PartitionsOf(disk.path)) {
            Node part = {
                .name = DeviceName(partition), .kind = "partition", .parents = {name}, .size = SizeOf(partition)};
            LookAt(part, partition);
            AddArrayOf(partition, Add(std::move(part), row));
        }
    }

    // The mounts and arrays on a disk or partition.
    void LookAt(Node &node, const std::string &path) const
    {
        for (const Mount &mount : mounts_)
            if (mount.source == path) {
                node.mount = mount.place;
                node.filesystem = mount.type;
            }
        if (const auto [array, member] = ArrayOf(path); array)
            node.state = MemberState(member->nState) + " in " + DeviceName(array->szPath);
    }

    void AddArrayOf(const std::string &path, int above)
    {
        if (const RAIDINFO *array = ArrayOf(path).first)
            AddArray(*array, above);
    }

    void AddArray(const RAIDINFO &array, int above)
    {
        const std::string name = DeviceName(array.szPath);
        if (!shown_.insert(name).second)
            return;
        Node node = {.name = name,
                     .kind = "array",
                     .parents = Mapped(Members(array, ~0), DeviceName),
                     .size = Bytes{array.cbArray}};
        node.state = LevelText(array.fLevel) + " " + StatusText(array.nStatus);
        if (const auto rebuild = RebuildOf(array))
            *node.state += ", " + ActionOf(array) + " " + std::to_string(rebuild->Percent()) + " %";
        LookAt(node, array.szPath);
        const int row = Add(std::move(node), above);
        for (const Volume &volume : volumes_)
            if (Contains(volume.devices, name) && !shown_.contains(volume.group))
                AddGroup(volume.group, row);
    }

    void AddGroup(const std::string &group, int above)
    {
        shown_.insert(group);
        const auto of_group = [&](const Volume &volume) { return volume.group == group; };
        const Volume &first = *std::find_if(volumes_.begin(), volumes_.end(), of_group);
        const int row = Add({.name = group, .kind = "group", .parents = first.devices}, above);
        for (const Volume &volume : volumes_) {
            if (!of_group(volume))
                continue;
            Node node = {.name = volume.device,
                         .kind = "volume",
                         .parents = {group},
                         .size = volume.size,
                         .available = volume.available};
            node.state = !volume.active ? "not active" : volume.mount.empty() ? "not mounted" : "mounted";
            node.mount = Maybe(volume.mount);
            for (const Mount &mount : mounts_)
                if (!volume.mount.empty() && mount.place == volume.mount)
                    node.filesystem = mount.type;
            Add(std::move(node), row);
        }
    }

    std::vector<Array> arrays_;
    std::vector<Volume> volumes_;
    std::vector<Mount> mounts_;
    std::vector<Node> nodes_;
    std::vector<int> above_;
    std::set<std::string> shown_;  // arrays and groups
};

Action StorageShow(Arguments &)
{
    return [](Call &call) { call.Print(StorageTree()); };
}

}  // namespace

Table StorageTree()
{
    const std::vector<std::string> disks = DiskPaths();
    return Tree(std::none_of(disks.begin(), disks.end(), Sleeps)).Draw();
}

std::vector<ColumnFacts> StorageColumns()
{
    return Facts(node_columns);
}

void AddStorage(Program &program)
{
    program.Add("storage", "Everything from the bays to the volumes")
        .Add("", reads, Answer::List(node_columns), StorageShow,
             R"(Shows what is in each bay and what it is used for, as a tree: disk,
partition, array, group, volume. An array is shown once, below its first member that is there. No sleeping disk is
woken; while one sleeps, groups that are not active are not shown.

tavoctl storage
tavoctl storage --json)");
}

}  // namespace tavoctl
