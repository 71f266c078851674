// Knows the USB devices whose data lives in a fixed partition.
#include "tavo_partition.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "storage/detail/device_name.h"
#include "storage/detail/usb_id.h"

namespace {

constexpr unsigned kVendor = 0x05AC;

struct SpecialDevice {
    unsigned product;
    int partition;
};

// clang-format off
constexpr SpecialDevice kDevices[] = {
    {0x1201, 2}, {0x1203, 2}, {0x1204, 2}, {0x1209, 2}, {0x1202, 2},
    {0x1205, 2}, {0x1300, 0}, {0x1301, 0}, {0x120A, 2}, {0x1260, 2},
};
// clang-format on

}  // namespace

extern "C" int TAVOCheckSpecialDevice(const char *szDisk)
{
    if (!szDisk) {
        LogError("%s:%d Bad parameters");
        return -1;
    }
    const std::string_view name = tavo::WithoutNumber(tavo::WithoutDev(szDisk));
    if (!tavo::IsDeviceName(name))
        return -1;
    return Guard([&] {
        const auto id = tavo::UsbIdOfDisk(name);
        if (!id || id->vendor != kVendor)
            return -1;
        for (const SpecialDevice &device : kDevices) {
            if (device.product == id->product)
                return device.partition;
        }
        return -1;
    });
}
