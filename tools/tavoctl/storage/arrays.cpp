// Arrays as the storage verbs show them.
#include "storage/arrays.h"

#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/files.h"
#include "frame/lists.h"
#include "storage/device.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <iterator>
#include <sstream>
#include <string_view>

namespace tavoctl {
namespace {

struct Level {
    int level;
    const char *name;
};

constexpr Level levels[] = {
    {RAID_LEVEL_0, "raid0"}, {RAID_LEVEL_1, "raid1"},   {RAID_LEVEL_5, "raid5"},
    {RAID_LEVEL_6, "raid6"}, {RAID_LEVEL_10, "raid10"}, {RAID_LEVEL_LINEAR, "linear"},
};

std::optional<std::string> Attribute(const RAIDINFO &info, const std::string &name)
{
    return KernelText(ArrayFile(info.szPath, name));
}

std::string Duration(uint64_t seconds)
{
    char text[48];
    const auto hours = static_cast<unsigned long>(seconds / 3600);
    const auto minutes = static_cast<unsigned>(seconds / 60 % 60);
    if (hours)
        std::snprintf(text, sizeof text, "%lu h %u min", hours, minutes);
    else if (minutes)
        std::snprintf(text, sizeof text, "%u min %u s", minutes, static_cast<unsigned>(seconds % 60));
    else
        std::snprintf(text, sizeof text, "%u s", static_cast<unsigned>(seconds));
    return text;
}

constexpr std::string_view array_device = "/dev/md";

std::string_view ArrayNumber(std::string_view word)
{
    if (word.starts_with(array_device))
        word.remove_prefix(array_device.size());
    else if (word.starts_with("md"))
        word.remove_prefix(2);
    return word;
}

// Returns whether it is the disk or a partition of it.
bool IsOn(const std::string &path, const std::string &disk)
{
    return path.starts_with(disk) && path.find_first_not_of("0123456789", disk.size()) == path.npos;
}

bool IsArrayName(const std::string &word)
{
    const std::string_view number = ArrayNumber(word);
    return !number.empty() && number.size() < 6 &&
           std::all_of(number.begin(), number.end(), [](unsigned char c) { return std::isdigit(c); });
}

}  // namespace

const ArgumentKind array_kind = {
    .name = "array",
    .allowed = "the name of an array, md2 or /dev/md2",
    .valid = IsArrayName,
    .candidates = ArrayNames,
    .sample = "md77",
    .wrong = "sda",
};

std::string ArrayPath(const std::string &word)
{
    return std::string(array_device).append(ArrayNumber(word));
}

Array ReadArray(const std::string &path)
{
    RAIDINFO *info = nullptr;
    const int found = RAIDInfoGet(path.c_str(), &info);
    Must(found >= 0, "read the array " + path);
    if (found == 0)
        throw NotFound("read the array " + path, ERR_PATH_NOT_FOUND, "tavoctl raid list shows the arrays that run");
    return Array(info);
}

bool Runs(const std::string &path)
{
    RAIDINFO *info = nullptr;
    const bool runs = RAIDInfoGet(path.c_str(), &info) == 1;
    RAIDInfoFree(info);
    return runs;
}

std::vector<Array> ReadArrays()
{
    RAIDLIST *list = nullptr;
    Must(RAIDInfoEnum(&list) >= 0, "list the arrays");
    const std::unique_ptr<RAIDLIST, By<RAIDListFree>> owner(list);
    std::vector<Array> arrays;
    for (RAIDLIST *node = list; node; node = node->pNext)
        arrays.emplace_back(std::exchange(node->pInfo, nullptr));
    return arrays;
}

std::vector<std::string> ArrayNames()
{
    StringList paths;
    return RAIDPathEnum(paths.Address()) > 0 ? Mapped(paths.Items(), DeviceName) : std::vector<std::string>();
}

const char *StatusText(int status)
{
    return status == 0                      ? "stopped"
           : status == RAID_STATUS_NORMAL   ? "normal"
           : status == RAID_STATUS_DEGRADED ? "degraded"
                                            : "crashed";
}

std::string LevelText(int level)
{
    const auto *found =
        std::find_if(std::begin(levels), std::end(levels), [&](const Level &known) { return known.level == level; });
    return found == std::end(levels) ? "" : found->name;
}

std::optional<int> LevelOf(const std::string &word)
{
    for (const Level &known : levels)
        if (word == known.name || "raid" + word == known.name)
            return known.level;
    return std::nullopt;
}

std::vector<std::string> Members(const RAIDINFO &info, int states)
{
    std::vector<std::string> paths;
    for (const RAIDMEMBER *member = info.pMembers; member; member = member->pNext)
        if (member->nState & states)
            paths.emplace_back(member->szPath);
    return paths;
}

std::string MemberOf(const RAIDINFO &info, const std::string &word)
{
    const std::string path = DevicePath(word);
    const std::vector<std::string> members = Members(info, ~0);
    if (Contains(members, path))
        return path;
    if (std::isdigit(static_cast<unsigned char>(path.back())))
        return "";
    const auto part =
        std::find_if(members.begin(), members.end(), [&](const std::string &member) { return IsOn(member, path); });
    return part == members.end() ? "" : *part;
}

std::string ArrayFile(const std::string &path, const std::string &name)
{
    return "/sys/block/" + DeviceName(path) + "/md/" + name;
}

std::string ActionOf(const RAIDINFO &info)
{
    const std::string action = Attribute(info, "sync_action").value_or("idle");
    return action == "idle" ? "" : action;
}

std::optional<Rebuild> RebuildOf(const RAIDINFO &info)
{
    // "1024 / 409600" in sectors; "none" or "delayed" otherwise.
    std::istringstream text(Attribute(info, "sync_completed").value_or(""));
    Rebuild rebuild = {};
    char slash = 0;
    if (!(text >> rebuild.done >> slash >> rebuild.total) || slash != '/' || rebuild.total == 0)
        return std::nullopt;
    std::istringstream speed(Attribute(info, "sync_speed").value_or("0"));
    if (!(speed >> rebuild.speed))
        rebuild.speed = 0;
    return rebuild;
}

std::string Rebuild::Text() const
{
    std::string text = std::to_string(Percent()) + " %";
    if (speed > 0) {
        char rate[32];
        std::snprintf(rate, sizeof rate, ", %.1f MiB/s, ", static_cast<double>(speed) / 1024);
        text += rate + Duration((total - std::min(done, total)) / 2 / speed) + " left";
    }
    return text;
}

std::vector<std::string> ArraysOf(const std::vector<Array> &arrays, const std::string &disk)
{
    std::vector<std::string> names;
    for (const Array &array : arrays) {
        const std::vector<std::string> members = Members(*array, ~0);
        if (std::any_of(members.begin(), members.end(), [&](const std::string &path) { return IsOn(path, disk); }))
            names.push_back(DeviceName(array->szPath));
    }
    return names;
}

}  // namespace tavoctl
