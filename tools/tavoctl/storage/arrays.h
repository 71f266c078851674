// Arrays as the storage verbs show them.
#ifndef TAVOCTL_ARRAYS_H
#define TAVOCTL_ARRAYS_H

#include "tavo_raid.h"

#include "frame/arguments.h"
#include "frame/containers.h"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

using Array = std::unique_ptr<RAIDINFO, By<RAIDInfoFree>>;

extern const ArgumentKind array_kind;
inline constexpr char array_help[] = "its name, md2 or /dev/md2";

// "/dev/md2" of "md2", "2" or "/dev/md2".
std::string ArrayPath(const std::string &word);

// Throws a Failure when there is no such array.
Array ReadArray(const std::string &path);
std::vector<Array> ReadArrays();
bool Runs(const std::string &path);
std::vector<std::string> ArrayNames();  // for completion

const char *StatusText(int status);  // "degraded"; 0: "stopped"
std::string LevelText(int level);    // "raid5"
std::optional<int> LevelOf(const std::string &word);

// The paths of the members in one of these states, RAID_MEMBER_ bits.
std::vector<std::string> Members(const RAIDINFO &info, int states);

// The member of an array that is, or is a partition of, the device that a word names; empty when none is.
std::string MemberOf(const RAIDINFO &info, const std::string &word);

// A file of the kernel's about an array, "/sys/block/md2/md/sync_action".
std::string ArrayFile(const std::string &path, const std::string &name);

// The kernel's present work on an array: "recover", "resync", "reshape", "check"; empty for none.
std::string ActionOf(const RAIDINFO &info);

struct Rebuild {
    uint64_t done;   // sectors
    uint64_t total;  // sectors, not 0
    uint64_t speed;  // KiB a second; 0 when not known

    int Percent() const { return static_cast<int>(done * 100 / total); }
    std::string Text() const;  // "34 %, 52.3 MiB/s, 12 min 5 s left"
};
std::optional<Rebuild> RebuildOf(const RAIDINFO &info);

// The arrays, "md0", that a disk or its partitions are members of.
std::vector<std::string> ArraysOf(const std::vector<Array> &arrays, const std::string &disk);

}  // namespace tavoctl

#endif
