// The USB device of a disk.
#ifndef TAVO_STORAGE_DETAIL_USB_ID_H
#define TAVO_STORAGE_DETAIL_USB_ID_H

#include <optional>
#include <string_view>

namespace tavo {

struct UsbId {
    unsigned vendor;
    unsigned product;
};

// From /sys, for the disk of kernel name `name`; empty when it is not on USB.
std::optional<UsbId> UsbIdOfDisk(std::string_view name);

// Four hexadecimal digits and a newline, as the kernel gives an id.
std::optional<unsigned> ParseUsbId(std::string_view text);

}  // namespace tavo

#endif
