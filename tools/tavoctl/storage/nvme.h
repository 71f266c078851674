// NVMe disks, which do not sit in a bay: facts from the kernel and the drive. Nothing is changed.
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

}  // namespace tavoctl

#endif
