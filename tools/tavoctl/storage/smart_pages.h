// The health of a drive from its pages.
#ifndef TAVOCTL_SMART_PAGES_H
#define TAVOCTL_SMART_PAGES_H

#include "storage/smart.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

// The self-test that runs, or ran last, as the SMART data page tells it.
struct SelfTest {
    bool running;
    int percent;         // of the running one
    std::string result;  // of the last one: "passed", "stopped", "failed: it cannot read"; "running"
    bool failed;
    int short_minutes, long_minutes;  // that one takes; 0: not known
};
SelfTest ParseSelfTest(const unsigned char (&page)[512]);

// One of the last errors that a drive has written down.
struct DriveError {
    int number;  // counted by the drive
    int hours;   // that it had been on
    std::string error;
    uint64_t sector;
    int command;  // of ATA
};
struct ErrorLog {
    int count;                     // of all errors so far
    std::vector<DriveError> last;  // up to five, the newest first
};
ErrorLog ParseErrorLog(const unsigned char (&page)[512]);

// The verdict on a drive and its reason: "failing", "worn" or "good".
struct Verdict {
    const char *verdict;
    std::string reason;
};
Verdict Judge(const std::vector<SmartAttribute> &attributes, const SelfTest &test);

// The verdict of an NVMe disk's health log; nothing for another page.
struct NvmeHealth {
    int temperature;  // degrees Celsius
    std::string text;
};
std::optional<NvmeHealth> ParseNvmeHealth(const unsigned char (&page)[512]);

// The raw value of an attribute; nothing when the drive does not count it.
std::optional<uint64_t> RawOf(const std::vector<SmartAttribute> &attributes, int id);

}  // namespace tavoctl

#endif
