// GUID partition tables.
#include "guid_table.h"

#include <algorithm>
#include <cstring>
#include <string_view>

#include <libfdisk.h>

namespace sfdisk {
namespace {

constexpr uint8_t kGuidTable = 0xEE;

// "34": the first sector after the table's 128 entries. Left to itself libfdisk would begin at 2048, above the start of
// every layout of the appliance.
constexpr const char *kFirstSector = "34";

struct TypeGuid {
    uint8_t type;
    std::string_view guid;
};

constexpr TypeGuid kTypes[] = {
    {0xFD, "A19D880F-05FC-4D3B-A006-743F0F84911E"}, {0x82, "0657FD6D-A4AB-43C4-84E5-0933C84B4F4F"},
    {0x83, "0FC63DAF-8483-4772-8E79-3D69D8477DE4"}, {0x8E, "E6D6D379-F507-44C2-A23C-238F2A3DF928"},
    {0x07, "EBD0A0A2-B9E5-4433-87C0-68B6B72699C7"}, {0xEF, "C12A7328-F81F-11D2-BA4B-00A0C93EC93B"},
};

// The types that the appliance makes.
const char *GuidOf(uint8_t type)
{
    for (const TypeGuid &row : kTypes) {
        if (row.type == type && (type == 0xFD || type == 0x82 || type == 0x83))
            return row.guid.data();
    }
    throw Failure("a GUID partition table takes the types fd, 82 and 83 only");
}

uint8_t TypeOf(const fdisk_parttype *type)
{
    const char *const text = type ? fdisk_parttype_get_string(type) : nullptr;
    for (const TypeGuid &row : kTypes) {
        if (text && row.guid == text)
            return row.type;
    }
    return kGuidTable;
}

void Check(int result, const char *what)
{
    if (result != 0)
        throw Failure(std::string(what) + ": " + std::strerror(-result));
}

struct Drop {
    void operator()(fdisk_table *table) const { fdisk_unref_table(table); }
    void operator()(fdisk_iter *iterator) const { fdisk_free_iter(iterator); }
    void operator()(fdisk_partition *partition) const { fdisk_unref_partition(partition); }
    void operator()(fdisk_parttype *type) const { fdisk_unref_parttype(type); }
    void operator()(fdisk_script *script) const { fdisk_unref_script(script); }
};

template <class Object>
using Held = std::unique_ptr<Object, Drop>;

template <class Object>
Held<Object> Hold(Object *object)
{
    if (!object)
        throw Failure("out of memory");
    return Held<Object>(object);
}

void WriteTable(fdisk_context *context)
{
    Check(fdisk_write_disklabel(context), "cannot write the GUID partition table");
}

}  // namespace

bool HasGuidTable(const BlockTarget &disk)
{
    const Sector sector = disk.Read(0);
    for (size_t slot = 0; HasSignature(sector) && slot < 4; ++slot) {
        const TableEntry entry = ReadEntry(sector, slot);
        if (!entry.IsEmpty() && entry.type == kGuidTable)
            return true;
    }
    return false;
}

bool IsGuidHeader(const Sector &sector)
{
    constexpr std::string_view signature = "EFI PART";
    return std::equal(signature.begin(), signature.end(), sector.begin());
}

void GuidTable::Release::operator()(fdisk_context *context) const
{
    fdisk_unref_context(context);
}

GuidTable::Context GuidTable::Open(const BlockTarget &disk)
{
    Context context(fdisk_new_context());
    if (!context)
        throw Failure("out of memory");
    fdisk_disable_dialogs(context.get(), 1);
    Check(fdisk_assign_device_by_fd(context.get(), disk.Descriptor(), disk.Path().c_str(), disk.IsReadOnly() ? 1 : 0),
          "cannot look for a GUID partition table");
    return context;
}

GuidTable::GuidTable(const BlockTarget &disk) : context_(Open(disk))
{
    if (!fdisk_is_labeltype(context_.get(), FDISK_DISKLABEL_GPT))
        throw Failure("has a damaged GUID partition table (-M1 replaces it)");
}

void GuidTable::Create(const BlockTarget &disk)
{
    const Context context = Open(disk);
    const Held<fdisk_script> script = Hold(fdisk_new_script(context.get()));
    Check(fdisk_script_set_header(script.get(), "first-lba", kFirstSector), "cannot prepare a GUID partition table");
    Check(fdisk_set_script(context.get(), script.get()), "cannot prepare a GUID partition table");
    Check(fdisk_create_disklabel(context.get(), "gpt"), "cannot make a GUID partition table");
    fdisk_set_script(context.get(), nullptr);
    WriteTable(context.get());
}

std::vector<Partition> GuidTable::Partitions() const
{
    fdisk_table *all = nullptr;
    Check(fdisk_get_partitions(context_.get(), &all), "cannot read the GUID partition table");
    const Held<fdisk_table> table(all);
    const Held<fdisk_iter> iterator = Hold(fdisk_new_iter(FDISK_ITER_FORWARD));
    std::vector<Partition> partitions;
    fdisk_partition *partition = nullptr;
    while (fdisk_table_next_partition(table.get(), iterator.get(), &partition) == 0) {
        if (!fdisk_partition_is_used(partition))
            continue;
        const TableEntry entry = {.boot = 0,
                                  .type = TypeOf(fdisk_partition_get_type(partition)),
                                  .start = fdisk_partition_get_start(partition),
                                  .count = fdisk_partition_get_size(partition)};
        partitions.push_back({static_cast<int>(fdisk_partition_get_partno(partition)) + 1, entry, 0, 0});
    }
    std::sort(partitions.begin(), partitions.end(),
              [](const Partition &left, const Partition &right) { return left.number < right.number; });
    return partitions;
}

Room GuidTable::Usable() const
{
    return {.first = fdisk_get_first_lba(context_.get()),
            .end = fdisk_get_last_lba(context_.get()) + 1,
            .has_logical = false,
            .end_name = "of the disk"};
}

void GuidTable::Put(int number, const TableEntry &entry)
{
    const auto type =
        Hold(fdisk_label_get_parttype_from_string(fdisk_get_label(context_.get(), nullptr), GuidOf(entry.type)));
    const Held<fdisk_partition> partition = Hold(fdisk_new_partition());
    const size_t index = static_cast<size_t>(number) - 1;
    if (fdisk_is_partition_used(context_.get(), index))
        Remove(number);
    Check(fdisk_partition_set_partno(partition.get(), index), "cannot place the partition");
    Check(fdisk_partition_set_start(partition.get(), entry.start), "cannot place the partition");
    Check(fdisk_partition_set_size(partition.get(), entry.count), "cannot place the partition");
    Check(fdisk_partition_size_explicit(partition.get(), 1), "cannot place the partition");
    Check(fdisk_partition_set_type(partition.get(), type.get()), "cannot place the partition");
    Check(fdisk_add_partition(context_.get(), partition.get(), nullptr), "cannot add the partition");
}

void GuidTable::Remove(int number)
{
    Check(fdisk_delete_partition(context_.get(), static_cast<size_t>(number) - 1), "cannot empty the entry");
}

void GuidTable::Write()
{
    WriteTable(context_.get());
}

}  // namespace sfdisk
