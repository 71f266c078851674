// The command line: exactly the options that the appliance uses.
#ifndef SFDISK_OPTIONS_H
#define SFDISK_OPTIONS_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace sfdisk {

enum class Action { list, create, clear, label, help };

struct Options {
    Action action = Action::help;
    std::string path;
    int number = 0;                 // -N: partition 1 to 255; 0: all, for -l
    std::optional<uint64_t> start;  // -o: sector at which the partition starts
    std::optional<uint64_t> gap;    // -j: sectors to leave free before it
    std::optional<uint64_t> count;  // -z: sectors; empty: the rest of the disk
    uint8_t type = 0;               // -t
    bool quiet = false;             // -q: no remarks
    bool force = false;             // -f: also a disk that is in use
    bool reread = true;             // not --no-reread
};

// Empty with the reason in `complaint` when the words are no command of ours.
std::optional<Options> ParseOptions(const std::vector<std::string_view> &words, std::string &complaint);

extern const char *const kHelp;

}  // namespace sfdisk

#endif
