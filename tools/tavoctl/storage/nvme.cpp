// NVMe disks.
#include "storage/nvme.h"

#include "frame/folder_names.h"
#include "storage/device.h"
#include "storage/smart_pages.h"

#include <algorithm>

#include <fcntl.h>
#include <linux/nvme_ioctl.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace tavoctl {
namespace {

constexpr std::size_t page_size = 512;

bool ReadHealthPage(const std::string &disk, unsigned char (&page)[page_size])
{
    constexpr unsigned char get_log_page = 2;
    constexpr unsigned health_log = 2;
    constexpr unsigned words = page_size / 4 - 1;
    const int fd = ::open(disk.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0)
        return false;
    nvme_admin_cmd command = {};
    command.opcode = get_log_page;
    command.nsid = ~0U;
    command.addr = reinterpret_cast<uintptr_t>(page);
    command.data_len = page_size;
    command.cdw10 = words << 16 | health_log;
    const bool read = ::ioctl(fd, NVME_IOCTL_ADMIN_CMD, &command) == 0;
    ::close(fd);
    return read;
}

std::string WithoutBlanks(std::string text)
{
    return text.erase(text.find_last_not_of(' ') + 1);
}

}  // namespace

std::vector<NvmeDisk> NvmeDisks()
{
    std::vector<NvmeDisk> disks;
    for (const std::string &name : FolderNames("/sys/block")) {
        if (!name.starts_with("nvme"))
            continue;
        const std::string block = "/sys/block/" + name;
        NvmeDisk disk = {name,
                         WithoutBlanks(KernelText(block + "/device/model").value_or("")),
                         WithoutBlanks(KernelText(block + "/device/serial").value_or("")),
                         std::stoull(KernelText(block + "/size").value_or("0")) * 512,
                         {},
                         {}};
        unsigned char page[page_size] = {};
        if (ReadHealthPage("/dev/" + name, page))
            if (const auto health = ParseNvmeHealth(page)) {
                disk.temperature = health->temperature;
                disk.health = health->text;
            }
        disks.push_back(std::move(disk));
    }
    std::sort(disks.begin(), disks.end(),
              [](const NvmeDisk &left, const NvmeDisk &right) { return left.name < right.name; });
    return disks;
}

}  // namespace tavoctl
