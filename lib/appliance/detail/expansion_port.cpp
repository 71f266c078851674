// Expansion units as the kernel shows them.
#include "appliance/detail/expansion_port.h"

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"

#include <cstring>
#include <string>

namespace tavo {
namespace {

std::string FirstLine(const std::string &path)
{
    const Fd file = OpenFd(path.c_str(), O_RDONLY);
    LineReader lines(file.Get());
    std::string_view line;
    return file && lines.Next(line) ? std::string(WithoutNewline(line)) : std::string();
}

}  // namespace

bool CanSeePorts()
{
    return bool(OpenFd("/sys/class/ata_device", O_PATH | O_DIRECTORY));
}

bool HasPortMultiplier(int port)
{
    return FirstLine("/sys/class/ata_device/dev" + std::to_string(port + 1) + ".0/class") == "pmp";
}

bool HasLink(int port)
{
    const std::string speed = FirstLine("/sys/class/ata_link/link" + std::to_string(port + 1) + "/sata_spd");
    return !speed.empty() && speed != "<unknown>";
}

void ListUnitDisks(TAVOEBOX &box)
{
    box.nDisk = 0;
    for (int letter = 0; letter < TAVO_EBOX_DISKS; ++letter) {
        const char name[] = {'s', 'd', static_cast<char>('a' + box.iUnit - 1), static_cast<char>('a' + letter), 0};
        if (!OpenFd((std::string("/sys/block/") + name).c_str(), O_PATH))
            continue;
        char *const path = box.rgszDisk[box.nDisk++];
        std::strcpy(path, "/dev/");
        std::strcat(path, name);
    }
}

}  // namespace tavo
