// Takes the place of the kernel's view of the disks: while a DeviceTree exists, this process finds /dev/sd*, /dev/md*,
// /dev/ttyS1, /sys, /proc/partitions, /proc/mounts and the model's settings in a directory of the test's own. Programs
// that it starts do not.
#ifndef TESTS_SUPPORT_DEVICE_TREE_H
#define TESTS_SUPPORT_DEVICE_TREE_H

#include "support/scratch_dir.h"

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include <sys/types.h>

namespace test {

class DeviceTree {
  public:
    DeviceTree();
    ~DeviceTree();
    DeviceTree(const DeviceTree &) = delete;
    DeviceTree &operator=(const DeviceTree &) = delete;

    // Any of the redirected files, with the directories above it.
    void Put(const std::string &path, std::string_view text);
    void Link(const std::string &path, const std::string &target);
    void Remove(const std::string &path);

    // A device node: fstat tells a block device of that number.
    void AddDisk(const std::string &path, unsigned major, unsigned minor, std::string_view content = "");
    // A node whose device is missing: opening it fails with ENXIO.
    void AddAbsent(const std::string &path);

    // The kernel uses the device of this path: opening it exclusively fails with EBUSY.
    void AddBusy(const std::string &path) { Put(path + kBusy, ""), Put(path, ""); }
    static constexpr const char *kBusy = ".busy";

    // Every path that was opened, in order, as the library named it.
    std::vector<std::string> Opened() const;

    // For the interposed functions; they allocate nothing, so that a test may count or refuse what the library allocates.
    bool Redirects(std::string_view path) const;
    std::string Place(std::string_view path) const { return dir_ / std::string(path); }
    const char *Place(const char *path, char (&room)[4096]) const;
    void NoteOpen(const char *path);
    bool IsDisk(ino_t inode, dev_t &number) const;
    static DeviceTree *Current();

  private:
    ScratchDir dir_;
    std::map<ino_t, dev_t> disks_;
    size_t noted_ = 0;
    char notes_[1 << 18];  // each path ends in a NUL
};

}  // namespace test

#endif
