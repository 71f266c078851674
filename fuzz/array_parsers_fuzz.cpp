// What mdadm, the LVM tools and /proc/mounts say: parsers read no further than the text, keep to what it plainly says, and
// let no name through that a shell reads otherwise.
#include "core/detail/mount_table.h"
#include "input.h"
#include "storage/detail/array_name.h"
#include "storage/detail/lvm_line.h"
#include "storage/detail/mdadm_examine.h"
#include "storage/detail/volume_name.h"

#include <algorithm>
#include <cstring>
#include <sstream>
#include <string>

using fuzz::Check;

namespace {

template <size_t N>
bool Ends(const char (&text)[N])
{
    return std::memchr(text, 0, N) != nullptr;
}

bool LiesWithin(std::string_view part, std::string_view whole)
{
    return part.data() >= whole.data() && part.data() + part.size() <= whole.data() + whole.size();
}

bool IsPlain(std::string_view name)
{
    return name.find_first_of("/;&|$`'\"\\ \t\r\n*?[]{}()<>~#!\x7f") == name.npos && name.find("..") == name.npos &&
           name[0] != '-';
}

// As RAIDSBGet reads it: to the first line that cannot be understood.
void CheckExamine(const std::string &text)
{
    RAIDSUPERBLOCK superblock = {};
    std::istringstream lines(text);
    std::string wrong;
    for (std::string line; std::getline(lines, line);) {
        if (tavo::ReadExamineLine(line, superblock, wrong) != tavo::ExamineOutcome::good) {
            Check(line.find(wrong) != line.npos, "a complaint about what is not in the line");
            break;
        }
    }
    Check(Ends(superblock.szUuid) && Ends(superblock.szArray), "a text without an end");
    Check(!*superblock.szArray || tavo::IsArrayPath(superblock.szArray), "a path that is none");
    Check(superblock.nEvent >= 0, "a number of events below 0");
}

void CheckPvLine(std::string_view text)
{
    const auto pv = tavo::ParsePvLine(text);
    if (!pv)
        return;
    Check(Ends(pv->szPv) && Ends(pv->szVg) && Ends(pv->szUuid), "a text without an end");
    Check(std::strncmp(pv->szPv, "/dev/", 5) == 0, "a device elsewhere");
    Check(!*pv->szVg || std::strncmp(pv->szVg, "/dev/vg", 7) == 0, "a group elsewhere");
    const std::string again = std::string("  ") + pv->szPv + "|" + (*pv->szVg ? pv->szVg + 5 : "") + "|" + pv->szUuid +
                              "|" + std::to_string(pv->nPv);
    const auto same = tavo::ParsePvLine(again);
    Check(same && !std::strcmp(same->szPv, pv->szPv) && !std::strcmp(same->szVg, pv->szVg) &&
              !std::strcmp(same->szUuid, pv->szUuid) && same->nPv == pv->nPv,
          "another record from its own text");
}

void CheckVolumes(std::string_view text)
{
    if (const auto uuid = tavo::ParseVgLine(text))
        Check(!uuid->empty() && LiesWithin(*uuid, text), "a UUID from outside the line");
    if (const auto volume = tavo::ParsePvVolumeLine(text)) {
        Check(LiesWithin(volume->device, text), "a device from outside the line");
        Check(IsPlain(volume->group) && IsPlain(volume->volume), "a name that a shell reads otherwise");
    }
    if (const auto name = tavo::ParseVolumePath(text)) {
        Check(IsPlain(name->group) && IsPlain(name->volume), "a name that a shell reads otherwise");
        Check(tavo::ParseVolumePath("/dev/" + name->group + "/" + name->volume) == name,
              "another volume from its path");
    }
    if (tavo::IsGroupPath(text))
        Check(IsPlain(text.substr(5)), "a group that a shell reads otherwise");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    CheckExamine(text);
    CheckPvLine(text);
    CheckVolumes(text);
    for (const tavo::Mount &mount : tavo::ParseMounts(text))
        Check(!mount.source.empty() && !mount.point.empty() && !mount.type.empty(), "a mount without a word");
    if (const auto number = tavo::ArrayNumber(text))
        Check(text == "/dev/md" + std::to_string(*number), "another array from its own number");
    Check(!tavo::IsArrayUuid(text) || tavo::IsSameArrayUuid(text, text), "a UUID that is not itself");
    return 0;
}
