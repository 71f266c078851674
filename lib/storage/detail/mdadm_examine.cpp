// Reads what "mdadm -E" says about a member's superblock, line by line.
#include "storage/detail/mdadm_examine.h"

#include "core/detail/strict_number.h"
#include "core/detail/text_fields.h"
#include "storage/detail/array_level.h"
#include "storage/detail/array_name.h"
#include "storage/detail/bounded_text.h"

#include <algorithm>
#include <climits>

#include <strings.h>

namespace tavo {
namespace {

// Returns the text before a remark in brackets: "naslab:0  (local to host naslab)".
std::string_view WithoutRemark(std::string_view value)
{
    const size_t bracket = value.find(" (");
    return bracket == value.npos ? value : Trimmed(value.substr(0, bracket));
}

std::string_view LeadingDigits(std::string_view text)
{
    return text.substr(0, std::min(text.find_first_not_of("0123456789"), text.size()));
}

// "1.2", and "0.90.00" of the old superblock.
bool ReadVersion(std::string_view value, RAIDSUPERBLOCK &superblock)
{
    const size_t dot = value.find('.');
    if (dot == value.npos)
        return false;
    const auto major = StrictNumber<int32_t>(value.substr(0, dot));
    const auto minor = StrictNumber<int32_t>(LeadingDigits(value.substr(dot + 1)));
    if (!major || !minor)
        return false;
    superblock.nMajor = *major;
    superblock.nMinor = *minor;
    return true;
}

// A name without a number, such as "nas:data", gives no path: any number here would be some other array's.
void ReadName(std::string_view value, RAIDSUPERBLOCK &superblock)
{
    const std::string_view name = WithoutRemark(value);
    if (const auto number = ArrayNumberText(name.substr(name.rfind(':') + 1)))
        CopyBounded(superblock.szArray, std::string(kArray) + std::to_string(*number));
}

bool ReadRole(std::string_view value, RAIDSUPERBLOCK &superblock)
{
    constexpr std::string_view active = "Active device ";
    if (value.starts_with("spare")) {
        superblock.iRole = -1;
        return true;
    }
    const auto slot = value.starts_with(active) ? StrictNumber<int32_t>(value.substr(active.size())) : std::nullopt;
    superblock.iRole = slot.value_or(superblock.iRole);
    return slot.has_value();
}

// Some versions print the halves of the old superblock's counter, "0.18"; the record holds the lower one.
void ReadEvents(std::string_view value, RAIDSUPERBLOCK &superblock)
{
    const auto events = StrictNumber<uint64_t>(value.substr(value.rfind('.') + 1));
    superblock.nEvent = static_cast<int32_t>(std::min<uint64_t>(events.value_or(0), INT32_MAX));
}

// The old superblock's row of its own device: "this     0       8        1        0      active sync   /dev/sda1".
bool ReadOwnRow(std::string_view row, RAIDSUPERBLOCK &superblock)
{
    const auto number = StrictNumber<int32_t>(LeadingDigits(Trimmed(row)));
    superblock.iRole = number.value_or(superblock.iRole);
    return number.has_value();
}

ExamineOutcome ReadPair(std::string_view key, std::string_view value, RAIDSUPERBLOCK &superblock)
{
    if (key == "Version")
        return ReadVersion(value, superblock) ? ExamineOutcome::good : ExamineOutcome::bad_version;
    if (key == "Device Role")
        return ReadRole(value, superblock) ? ExamineOutcome::good : ExamineOutcome::bad_role;
    if (key == "Array UUID" || key == "UUID")
        CopyBounded(superblock.szUuid, WithoutRemark(value));
    else if (key == "Raid Devices")
        superblock.nMember = StrictNumber<int32_t>(value).value_or(0);
    else if (key == "Raid Level")
        superblock.fLevel = LevelOfName(value);
    else if (key == "Name" || key == "Preferred Minor")
        ReadName(value, superblock);
    else if (key == "Events")
        ReadEvents(value, superblock);
    return ExamineOutcome::good;
}

}  // namespace

ExamineOutcome ReadExamineLine(std::string_view line, RAIDSUPERBLOCK &superblock, std::string &wrong)
{
    constexpr size_t longest = 1023;
    constexpr std::string_view own = "this";
    line = line.substr(0, longest);
    const size_t colon = line.find(':');
    if (colon == line.npos) {
        if (!line.starts_with(own) || ReadOwnRow(line.substr(own.size()), superblock))
            return ExamineOutcome::good;
        wrong = line.substr(own.size());
        return ExamineOutcome::bad_row;
    }
    const std::string_view value = Trimmed(line.substr(colon + 1));
    const ExamineOutcome outcome = ReadPair(Trimmed(line.substr(0, colon)), value, superblock);
    if (outcome != ExamineOutcome::good)
        wrong = value;
    return outcome;
}

bool IsArrayUuid(std::string_view text)
{
    constexpr size_t length = 35;
    constexpr size_t group = 9;
    if (text.size() != length)
        return false;
    for (size_t i = 0; i < length; ++i) {
        const bool colon = i % group == group - 1;
        if (colon ? text[i] != ':' : std::string_view("0123456789abcdefABCDEF").find(text[i]) == text.npos)
            return false;
    }
    return true;
}

bool IsSameArrayUuid(std::string_view left, std::string_view right)
{
    return IsArrayUuid(left) && IsArrayUuid(right) && ::strncasecmp(left.data(), right.data(), left.size()) == 0;
}

}  // namespace tavo
