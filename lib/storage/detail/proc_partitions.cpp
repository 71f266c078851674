// /proc/partitions.
#include "storage/detail/proc_partitions.h"

#include "tavo_error.h"

#include "core/detail/strict_number.h"

#include <algorithm>

namespace tavo {
namespace {

constexpr unsigned kIdeMajors[] = {3, 22, 33, 34, 56, 57, 88, 89, 90, 91};
constexpr unsigned kLargestMinor = 255;  // a device number has eight bits for it

constexpr bool IsBlank(char c)
{
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}

std::string_view TakeField(std::string_view &line)
{
    const char *begin = line.data();
    const char *const end = begin + line.size();
    while (begin != end && IsBlank(*begin))
        ++begin;
    const char *stop = begin;
    while (stop != end && !IsBlank(*stop))
        ++stop;
    line = {stop, static_cast<size_t>(end - stop)};
    return {begin, static_cast<size_t>(stop - begin)};
}

}  // namespace

bool PartitionsRow::IsWholeIdeDisk() const
{
    const bool ide = std::find(std::begin(kIdeMajors), std::end(kIdeMajors), major) != std::end(kIdeMajors);
    return ide && (minor == 0 || minor == 64);
}

bool PartitionsRow::IsWholeScsiDisk() const
{
    return (major == 8 || (major >= 65 && major <= 135)) && minor <= kLargestMinor && minor % 16 == 0;
}

std::optional<PartitionsRow> ParsePartitionsRow(std::string_view line)
{
    PartitionsRow row = {};
    if (!ReadNumber(TakeField(line), row.major) || !ReadNumber(TakeField(line), row.minor) ||
        !ReadNumber(TakeField(line), row.blocks))
        return std::nullopt;
    row.name = TakeField(line);
    return !row.name.empty() && TakeField(line).empty() ? std::optional(row) : std::nullopt;
}

bool PartitionsFile::NextRow(PartitionsRow &row)
{
    for (std::string_view line; Next(line);) {
        if (const auto parsed = ParsePartitionsRow(line)) {
            row = *parsed;
            return true;
        }
    }
    return false;
}

Code PartitionsFile::Failure() const
{
    if (!fd_)
        return ERR_OPEN_FAILED;
    return lines_.Failed() ? ERR_READ_FAILED : 0;
}

}  // namespace tavo
