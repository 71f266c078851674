// The USB device of a disk.
#include "storage/detail/usb_id.h"

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/strict_number.h"

#include <string>

namespace tavo {
namespace {

// From a disk's device up: target, host, interface, device. A few more for additional levels in other kernels.
constexpr int kLevels = 8;

std::optional<unsigned> ReadUsbId(const std::string &path)
{
    const Fd fd = OpenFd(path.c_str(), O_RDONLY);
    LineReader lines(fd.Get());
    std::string_view line;
    return fd && lines.Next(line) ? ParseUsbId(line) : std::nullopt;
}

}  // namespace

std::optional<unsigned> ParseUsbId(std::string_view text)
{
    text = WithoutNewline(text);
    return text.size() == 4 ? StrictNumber<unsigned>(text, 16) : std::nullopt;
}

std::optional<UsbId> UsbIdOfDisk(std::string_view name)
{
    std::string folder = "/sys/block/" + std::string(name) + "/device/";
    for (int level = 0; level < kLevels; ++level, folder += "../") {
        const std::optional<unsigned> vendor = ReadUsbId(folder + "idVendor");
        if (!vendor)
            continue;
        const std::optional<unsigned> product = ReadUsbId(folder + "idProduct");
        return product ? std::optional(UsbId{*vendor, *product}) : std::nullopt;
    }
    return std::nullopt;
}

}  // namespace tavo
