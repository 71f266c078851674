// A disk opened for raw commands.
#include "storage/detail/raw_disk.h"

#include "tavo_disk.h"

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "storage/detail/device_name.h"

#include <linux/hdreg.h>
#include <sys/ioctl.h>
#include <sys/sysmacros.h>

namespace tavo {
namespace {

struct MajorRange {
    unsigned first;
    unsigned last;
};

constexpr MajorRange kDiskMajors[] = {
    {3, 3}, {8, 8}, {22, 22}, {33, 34}, {56, 57}, {65, 71}, {88, 91}, {128, 135},
};

bool IsDiskMajor(unsigned number)
{
    for (const MajorRange &range : kDiskMajors) {
        if (number >= range.first && number <= range.last)
            return true;
    }
    return false;
}

bool ReadLinkText(const std::string &path, std::string &text)
{
    char target[4096];
    const ssize_t length = ::readlink(path.c_str(), target, sizeof target);
    if (length < 0)
        return false;
    text.assign(target, static_cast<size_t>(length));
    return true;
}

}  // namespace

Code OpenRawDisk(const char *path, Fd &fd)
{
    fd = OpenFd(path, O_RDONLY);
    if (!fd)
        return ERR_OPEN_RAWDEVICE;
    struct stat facts;
    if (::fstat(fd.Get(), &facts) != 0)
        return ERR_STAT_FAILED;
    return S_ISBLK(facts.st_mode) && IsDiskMajor(major(facts.st_rdev)) ? Code() : Code(ERR_NOT_A_DISK);
}

int HangsOnMarvell(const char *path, std::string &unreadable)
{
    const std::string block = "/sys/block/" + std::string(LastPart(path));
    std::string link;
    unreadable = block + "/device";
    if (!ReadLinkText(unreadable, link))
        return -1;
    if (link.find("devices/platform/host") != link.npos)
        return 1;
    const size_t host = link.find("host");
    if (host == link.npos)
        return 0;
    unreadable = block + "/" + link.substr(0, host) + "/device";
    const Fd id = OpenFd(unreadable.c_str(), O_RDONLY);
    LineReader lines(id.Get());
    std::string_view line;
    if (!id || !lines.Next(line))
        return -1;
    return line == "0x7042\n" || line == "0x6145\n" ? 1 : 0;
}

Code RawDisk::Open(const char *path)
{
    const Code code = OpenRawDisk(path, fd_);
    if (code == 0)
        ChooseInterface(path);
    return code;
}

bool RawDisk::OpenToRead(const char *path)
{
    fd_ = OpenFd(path, O_RDONLY);
    if (fd_)
        ChooseInterface(path);
    return bool(fd_);
}

void RawDisk::ChooseInterface(const char *path)
{
    std::string unreadable;
    marvell_ = HangsOnMarvell(path, unreadable) == 1;
}

int RawDisk::Command(int number, unsigned char *data) const
{
    return marvell_ ? marvell_command_interface(fd_.Get(), number, data)
                    : ata_command_interface(fd_.Get(), number, data);
}

bool RawDisk::Identify(DrivePage &identity) const
{
    return Command(DISK_COMMAND_IDENTIFY, identity.data()) == 0 ||
           Command(DISK_COMMAND_IDENTIFY_PACKET, identity.data()) == 0;
}

bool RawDisk::DriveCommand(uint8_t command, uint8_t count, uint8_t feature) const
{
    unsigned char arguments[4] = {command, count, feature, 0};
    return ::ioctl(fd_.Get(), HDIO_DRIVE_CMD, arguments) == 0;
}

}  // namespace tavo
