// Lines of pvs and vgs.
#include "storage/detail/lvm_line.h"

#include "core/detail/strict_number.h"
#include "storage/detail/bounded_text.h"

#include <array>
#include <cstdio>

namespace tavo {
namespace {

constexpr std::string_view kIndent = "  ";

// The first `count` fields of an indented line; false when it has fewer.
template <size_t Count>
bool Split(std::string_view line, char separator, std::array<std::string_view, Count> &fields)
{
    if (!line.starts_with(kIndent))
        return false;
    line.remove_prefix(kIndent.size());
    for (size_t i = 0; i < Count; ++i) {
        const size_t end = line.find(separator);
        if (end == line.npos && i + 1 < Count)
            return false;
        fields[i] = line.substr(0, end);
        line.remove_prefix(end == line.npos ? line.size() : end + 1);
    }
    return true;
}

std::string_view WithoutTail(std::string_view text)
{
    return text.substr(0, text.find_last_not_of(" \r\n") + 1);
}

}  // namespace

std::optional<LVMPV> ParsePvLine(std::string_view line)
{
    std::array<std::string_view, 4> fields;
    if (!Split(line, '|', fields) || !fields[0].starts_with("/dev/"))
        return std::nullopt;
    LVMPV pv = {};
    CopyBounded(pv.szPv, fields[0]);
    if (fields[1].starts_with("vg"))
        std::snprintf(pv.szVg, sizeof pv.szVg, "/dev/%.*s", static_cast<int>(fields[1].size()), fields[1].data());
    CopyBounded(pv.szUuid, fields[2]);
    pv.nPv = StrictNumber<int32_t>(WithoutTail(fields[3])).value_or(0);
    return pv;
}

std::optional<std::string_view> ParseVgLine(std::string_view line)
{
    if (!line.starts_with(kIndent))
        return std::nullopt;
    const std::string_view uuid = WithoutTail(line.substr(kIndent.size()));
    return uuid.empty() || uuid.find(' ') != uuid.npos ? std::nullopt : std::optional(uuid);
}

std::optional<PvVolume> ParsePvVolumeLine(std::string_view line)
{
    std::array<std::string_view, 4> fields;
    if (!Split(line, ':', fields) || !IsVolumeName(fields[1]) || !IsVolumeName(fields[2]))
        return std::nullopt;
    return PvVolume{fields[0], fields[1], fields[2]};
}

}  // namespace tavo
