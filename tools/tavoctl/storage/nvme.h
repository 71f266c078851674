// NVMe disks, which sit in no bay: what the kernel and the drive say of them. Nothing is changed.
#ifndef TAVOCTL_NVME_H
#define TAVOCTL_NVME_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

struct NvmeDisk {
    std::string name;  // "nvme0n1"
    std::string model, serial;
    uint64_t size;                   // bytes
    std::optional<int> temperature;  // degrees Celsius
    std::optional<std::string> health;
};

std::vector<NvmeDisk> NvmeDisks();

// What the drive's health log says; nothing for a page that is none.
struct NvmeHealth {
    int temperature;  // degrees Celsius
    std::string text;
};
std::optional<NvmeHealth> ParseNvmeHealth(const unsigned char (&page)[512]);

}  // namespace tavoctl

#endif
