// Block devices as the storage verbs take them: their names, whether they sleep, and who uses them.
#ifndef TAVOCTL_DEVICE_H
#define TAVOCTL_DEVICE_H

#include "tavo_disk.h"

#include "frame/arguments.h"
#include "frame/column.h"
#include "frame/text.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

// "/dev/sda3" of "sda3" or "/dev/sda3".
std::string DevicePath(const std::string &word);
std::vector<std::string> DevicePaths(const std::vector<std::string> &words);
std::string DeviceName(const std::string &path);  // "sda3"

// The path of a whole disk; throws a Failure when it is not there.
std::string DiskPath(const std::string &word);

std::vector<std::string> DiskPaths(const std::vector<std::string> &words);

// All disks: the internal bays in their order, then the others by name.
std::vector<std::string> DiskPaths();
std::vector<std::string> DiskNames();    // for completion
std::vector<std::string> DeviceNames();  // disks and partitions

// "1" for an internal bay, "1-2" for a disk of an expansion unit, "usb", "esata". A disk that came while its bay's name
// was still held has another one; its port says where it is. Empty where nothing does.
std::string BayOf(const std::string &disk);

enum class Power { spinning, standby, unknown };

// Asking wakes no disk.
Power PowerOf(const std::string &disk);

// Returns whether a device is a disk, or a partition of one, that is in standby.
bool Sleeps(const std::string &device);

// A disk that does not tell may sleep.
bool MayRead(const std::string &disk, bool wake);

// Throws a Failure when the caller may not read a device: the library reports such a drive like one that does not answer.
void RefuseUnreadable(const std::string &device, const std::string &attempted);

// The same, and when reading the disk would wake it, unless wake is set.
void RefuseToWake(const std::string &disk, bool wake, const std::string &attempted);

// Throws a Failure when one of all disks is in standby, unless wake is set.
void RefuseToWakeAny(bool wake, const std::string &attempted);

struct Mount {
    std::string source;
    std::string place;
    std::string type;  // "ext4"
};

// Throws a Failure when they cannot be read: a device whose users are not known must not count as free.
std::vector<Mount> Mounts();

// Returns why a device must not be overwritten, such as "/dev/sda1 is mounted on /mnt"; empty when it is unused.
std::string UseOf(const std::string &device);

// Throws a Failure when a path is a device in use, or not a device.
void RefuseUsed(const std::vector<std::string> &devices, const std::string &attempted);

// A 32-bit kernel reaches 16 TiB of one device: throws a Failure when a device of so many bytes is larger.
void RefuseTooLarge(uint64_t size, const std::string &attempted);
std::optional<Bytes> SizeOf(const std::string &device);       // nothing when it cannot be read
uint64_t SizeOfAll(const std::vector<std::string> &devices);  // bytes

inline constexpr char disk_help[] = "its name, sda or /dev/sda";
inline constexpr char member_help[] = "a partition or disk, sda3 or /dev/sda3";
inline constexpr char wake_help[] = "read it although that wakes it";

extern const ArgumentKind disk_kind;    // "sda" or "/dev/sda"
extern const ArgumentKind device_kind;  // a disk, a partition, an array

}  // namespace tavoctl

#endif
