// The SMART attributes of a drive.
#ifndef TAVOCTL_SMART_H
#define TAVOCTL_SMART_H

#include <cstdint>
#include <string>
#include <vector>

namespace tavoctl {

struct SmartAttribute {
    int id;
    int value;
    int worst;
    int threshold;  // -1 when the drive does not tell
    uint64_t raw;

    // A threshold of 0 is never reached.
    bool Fails() const { return threshold > 0 && value <= threshold; }
};

// Throws a Failure when the drive cannot be read. This wakes it.
std::vector<SmartAttribute> ReadSmart(const std::string &disk, const std::string &attempted);

// The usual meaning of an attribute; "" for one that every maker uses differently.
const char *SmartName(int id);

}  // namespace tavoctl

#endif
