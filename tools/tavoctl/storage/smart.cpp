// The SMART attributes of a drive.
#include "storage/smart.h"

#include "tavo_disk.h"

#include "frame/failure.h"
#include "frame/files.h"

namespace tavoctl {
namespace {

constexpr std::size_t page_size = 512;
constexpr int slots = 30;
constexpr int slot_size = 12;
constexpr int first_slot = 2;

bool ReadThresholds(const std::string &disk, unsigned char (&page)[page_size])
{
    const Descriptor drive(TAVOIDiskRawOpen(disk.c_str()));
    const auto command = TAVODiskIsMvSocDriver(disk.c_str()) == 1 ? marvell_command_interface : ata_command_interface;
    return drive.IsOpen() && command(drive.Get(), DISK_COMMAND_SMART_THRESHOLDS, page) == 0;
}

int ThresholdOf(const unsigned char (&page)[page_size], int id)
{
    for (int i = 0; i < slots; ++i) {
        const unsigned char *slot = page + first_slot + i * slot_size;
        if (slot[0] == id)
            return slot[1];
    }
    return -1;
}

uint64_t Raw(const unsigned char *bytes, int id)
{
    // Drives pack their lowest and highest temperature above the present one.
    const int width = id == 190 || id == 194 ? 2 : 6;
    uint64_t raw = 0;
    for (int i = width - 1; i >= 0; --i)
        raw = raw << 8 | bytes[i];
    return raw;
}

}  // namespace

std::vector<SmartAttribute> ReadSmart(const std::string &disk, const std::string &attempted)
{
    unsigned char data[page_size] = {};
    unsigned char thresholds[page_size] = {};
    FailIf(SmartDataRead(disk.c_str(), data, 0) != 0, attempted, "the drive does not give it");
    const bool has_thresholds = ReadThresholds(disk, thresholds);
    std::vector<SmartAttribute> attributes;
    for (int i = 0; i < slots; ++i) {
        const unsigned char *slot = data + first_slot + i * slot_size;
        if (slot[0] == 0)
            continue;
        attributes.push_back({slot[0], slot[3], slot[4], has_thresholds ? ThresholdOf(thresholds, slot[0]) : -1,
                              Raw(slot + 5, slot[0])});
    }
    return attributes;
}

}  // namespace tavoctl
