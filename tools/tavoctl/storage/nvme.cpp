// NVMe disks, which do not sit in a bay: facts from the kernel and the drive. Nothing is changed.
#include "frame/files.h"
#include "storage/disk_facts.h"
#include "storage/smart_pages.h"

#include <fcntl.h>
#include <linux/nvme_ioctl.h>
#include <sys/ioctl.h>

namespace tavoctl {
namespace {

constexpr std::size_t page_size = 512;

bool ReadHealthPage(const std::string &disk, unsigned char (&page)[page_size])
{
    constexpr unsigned char get_log_page = 2;
    constexpr unsigned health_log = 2;
    constexpr unsigned words = page_size / 4 - 1;
    const Descriptor drive(::open(disk.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    nvme_admin_cmd command = {};
    command.opcode = get_log_page;
    command.nsid = ~0U;
    command.addr = reinterpret_cast<uintptr_t>(page);
    command.data_len = page_size;
    command.cdw10 = words << 16 | health_log;
    return drive.IsOpen() && ::ioctl(drive.Get(), NVME_IOCTL_ADMIN_CMD, &command) == 0;
}

std::string WithoutBlanks(std::string text)
{
    return text.erase(text.find_last_not_of(' ') + 1);
}

}  // namespace

std::vector<DiskFacts> NvmeDisks()
{
    std::vector<DiskFacts> disks;
    for (const std::string &name : FolderNames("/sys/block")) {
        if (!name.starts_with("nvme"))
            continue;
        const std::string block = "/sys/block/" + name;
        DiskFacts disk = {.path = "/dev/" + name, .bay = "nvme", .power = Power::spinning};
        disk.model = Maybe(WithoutBlanks(KernelText(block + "/device/model").value_or("")));
        disk.serial = Maybe(WithoutBlanks(KernelText(block + "/device/serial").value_or("")));
        disk.size = Bytes{std::stoull(KernelText(block + "/size").value_or("0")) * 512};
        unsigned char page[page_size] = {};
        if (ReadHealthPage(disk.path, page))
            if (const auto health = ParseNvmeHealth(page)) {
                disk.temperature = health->temperature;
                disk.health = health->text;
            }
        disks.push_back(std::move(disk));
    }
    return disks;
}

}  // namespace tavoctl
