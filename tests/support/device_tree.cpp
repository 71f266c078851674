// Takes the place of the kernel's view of the disks.
#undef _FORTIFY_SOURCE  // its inline versions of these functions cannot be interposed

#include "support/device_tree.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include <dlfcn.h>
#include <fcntl.h>
#include <glob.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/un.h>
#include <unistd.h>

namespace test {
namespace {

DeviceTree *current = nullptr;

// 32-bit programs with 64-bit time and offsets call functions of other names.
#if defined(__TIMESIZE) && __TIMESIZE == 32
constexpr const char *kFstat = "__fstat64_time64";
constexpr const char *kGlob = "__glob64_time64";
#else
constexpr const char *kFstat = "fstat64";
constexpr const char *kGlob = "glob64";
#endif

template <class Function>
Function *Real(const char *name)
{
    return reinterpret_cast<Function *>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

DeviceTree::DeviceTree()
{
    current = this;
}

DeviceTree::~DeviceTree()
{
    current = nullptr;
}

DeviceTree *DeviceTree::Current()
{
    return current;
}

bool DeviceTree::Redirects(std::string_view path) const
{
    for (const std::string_view place : {"/dev/sd", "/dev/md", "/dev/ttyS1", "/sys/", "/proc/partitions",
                                         "/proc/mounts", "/proc/net/", "/etc.defaults/"}) {
        if (path.starts_with(place))
            return true;
    }
    return false;
}

void DeviceTree::Put(const std::string &path, std::string_view text)
{
    std::filesystem::create_directories(std::filesystem::path(Place(path)).parent_path());
    WriteFile(Place(path), text);
}

void DeviceTree::Link(const std::string &path, const std::string &target)
{
    std::filesystem::create_directories(std::filesystem::path(Place(path)).parent_path());
    std::filesystem::create_symlink(target, Place(path));
}

void DeviceTree::Remove(const std::string &path)
{
    std::filesystem::remove_all(Place(path));
}

void DeviceTree::AddDisk(const std::string &path, unsigned major, unsigned minor, std::string_view content)
{
    Put(path, content);
    struct stat facts;
    ASSERT_EQ(::stat(Place(path).c_str(), &facts), 0);
    disks_[facts.st_ino] = makedev(major, minor);
}

void DeviceTree::AddAbsent(const std::string &path)
{
    std::filesystem::create_directories(std::filesystem::path(Place(path)).parent_path());
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    ASSERT_LT(Place(path).size(), sizeof address.sun_path);
    std::strcpy(address.sun_path, Place(path).c_str());
    const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    ASSERT_EQ(::bind(socket, reinterpret_cast<sockaddr *>(&address), sizeof address), 0);
    ::close(socket);
}

const char *DeviceTree::Place(const char *path, char (&room)[4096]) const
{
    std::snprintf(room, sizeof room, "%s/%s", dir_.Path().c_str(), path);
    return room;
}

void DeviceTree::NoteOpen(const char *path)
{
    const size_t size = std::strlen(path) + 1;
    if (noted_ + size > sizeof notes_)
        return;
    std::memcpy(notes_ + noted_, path, size);
    noted_ += size;
}

std::vector<std::string> DeviceTree::Opened() const
{
    std::vector<std::string> paths;
    for (size_t at = 0; at < noted_; at += paths.back().size() + 1)
        paths.emplace_back(notes_ + at);
    return paths;
}

bool DeviceTree::IsDisk(ino_t inode, dev_t &number) const
{
    const auto found = disks_.find(inode);
    if (found == disks_.end())
        return false;
    number = found->second;
    return true;
}

}  // namespace test

using test::current;
using test::Real;

// Weak, because a test program may define one of them itself.
extern "C" {

[[gnu::weak]] int open(const char *path, int flags, ...)
{
    va_list args;
    va_start(args, flags);
    const mode_t mode = va_arg(args, mode_t);
    va_end(args);
    const auto real = Real<int(const char *, int, ...)>("open64");
    if (!current || !current->Redirects(path))
        return real(path, flags, mode);
    current->NoteOpen(path);
    char room[4096];
    const int excluding = O_EXCL | O_CREAT;
    if ((flags & excluding) == O_EXCL) {
        std::strcat(const_cast<char *>(current->Place(path, room)), test::DeviceTree::kBusy);
        if (::access(room, F_OK) == 0) {
            errno = EBUSY;
            return -1;
        }
    }
    return real(current->Place(path, room), flags, mode);
}

[[gnu::weak]] ssize_t readlink(const char *path, char *buffer, size_t size)
{
    const auto real = Real<ssize_t(const char *, char *, size_t)>("readlink");
    if (!current || !current->Redirects(path))
        return real(path, buffer, size);
    char room[4096];
    return real(current->Place(path, room), buffer, size);
}

ssize_t __readlink_chk(const char *path, char *buffer, size_t size, size_t)
{
    return readlink(path, buffer, size);
}

[[gnu::weak]] int fstat(int fd, struct stat *facts)
{
    const int result = Real<int(int, struct stat *)>(test::kFstat)(fd, facts);
    if (dev_t number; result == 0 && current && current->IsDisk(facts->st_ino, number)) {
        facts->st_mode = S_IFBLK | 0660;
        facts->st_rdev = number;
    }
    return result;
}

[[gnu::weak]] int glob(const char *pattern, int flags, int (*on_error)(const char *, int), glob_t *found)
{
    const auto real = Real<int(const char *, int, int (*)(const char *, int), glob_t *)>(test::kGlob);
    const bool redirected = current && current->Redirects(pattern);
    char room[4096];
    return real(redirected ? current->Place(pattern, room) : pattern, flags, on_error, found);
}
}
