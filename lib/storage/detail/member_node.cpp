// Members of arrays whose disks were pulled: the kernel's names for them.
#include "storage/detail/member_node.h"

#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/matching_paths.h"
#include "storage/detail/open_disk.h"

#include <optional>

namespace tavo {
namespace {

constexpr std::string_view kMember = "md/dev-";

// The number of the disk among all SCSI disks: 16 per major, which come in three runs.
std::optional<unsigned> DiskIndex(unsigned major_number, unsigned minor_number)
{
    const unsigned in_major = minor_number / 16;
    if (minor_number > 255)
        return std::nullopt;
    if (major_number == 8)
        return in_major;
    if (major_number >= 65 && major_number <= 71)
        return (major_number - 64) * 16 + in_major;
    if (major_number >= 128 && major_number <= 135)
        return (major_number - 120) * 16 + in_major;
    return std::nullopt;
}

}  // namespace

std::string ScsiName(unsigned major_number, unsigned minor_number)
{
    std::optional<unsigned> index = DiskIndex(major_number, minor_number);
    if (!index)
        return {};
    // As columns of a spreadsheet: a to z, aa, ab, ...
    std::string letters;
    for (unsigned rest = *index + 1; rest > 0; rest = (rest - 1) / 26)
        letters.insert(letters.begin(), static_cast<char>('a' + (rest - 1) % 26));
    const unsigned partition = minor_number % 16;
    return "sd" + letters + (partition ? std::to_string(partition) : "");
}

std::vector<std::string> MemberNames(int array)
{
    std::vector<std::string> names;
    if (const auto found = MatchingPaths(ArrayFile(array, kMember) + "*"))
        for (const std::string &path : *found)
            names.push_back(path.substr(path.rfind(kMember) + kMember.size()));
    return names;
}

bool IsMemberName(int array, std::string_view name)
{
    return HasNode(ArrayFile(array, std::string(kMember).append(name)).c_str());
}

bool IsFaulty(int array, std::string_view name)
{
    const std::optional<std::string> state = KernelText(ArrayFile(array, std::string(kMember).append(name) + "/state"));
    return state && state->find("faulty") != state->npos;
}

}  // namespace tavo
