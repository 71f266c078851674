// Recognises and creates the files of the stores.
#include "account/detail/btree_file.h"

#include "account/detail/store_sync.h"
#include "core/detail/extras.h"
#include "core/detail/open_file.h"

#include <bit>
#include <cstdint>
#include <cstring>
#include <string>

#include <db_185.h>

namespace tavo {
namespace {

// The fields of the first page that tell a whole btree file of this machine's byte order, by their offsets.
constexpr size_t kMagicAt = 12, kPageSizeAt = 20, kTypeAt = 25, kLastPageAt = 32, kHeader = 72;
constexpr uint8_t kBtreeMetaType = 9;

uint32_t Word(const char *page, size_t at)
{
    uint32_t word;
    std::memcpy(&word, page + at, sizeof word);
    return word;
}

// A file that cannot be read may be a store, so it must not be removed as a foreign file.
BtreeFile LookAtContent(int fd, off_t size)
{
    char page[kHeader];
    const ssize_t got = ::pread(fd, page, sizeof page, 0);
    if (got < 0)
        return BtreeFile::unreadable;
    const uint32_t page_size = got == static_cast<ssize_t>(sizeof page) ? Word(page, kPageSizeAt) : 0;
    const bool whole = page_size != 0 && Word(page, kMagicAt) == BTREEMAGIC &&
                       static_cast<uint8_t>(page[kTypeAt]) == kBtreeMetaType && std::has_single_bit(page_size) &&
                       page_size >= 512 && page_size <= 65536 &&
                       size >= (off_t{Word(page, kLastPageAt)} + 1) * page_size;
    return whole ? BtreeFile::store : BtreeFile::foreign;
}

// A directory of our own that goes away with what the database left in it.
class BuildDir {
  public:
    explicit BuildDir(const std::string &path) : path_(path + ".XXXXXX")
    {
        file_.reserve(path_.size() + sizeof "/store");
        left_over_.reserve(path_.size() + sizeof "/__db.store");
        made_ = ::mkdtemp(path_.data()) != nullptr;
        file_.append(path_).append("/store");
        left_over_.append(path_).append("/__db.store");
    }
    ~BuildDir()
    {
        KeepErrno keep;
        if (!made_)
            return;
        ::unlink(file_.c_str());
        ::unlink(left_over_.c_str());
        ::rmdir(path_.c_str());
    }
    BuildDir(const BuildDir &) = delete;
    BuildDir &operator=(const BuildDir &) = delete;

    explicit operator bool() const { return made_; }
    const char *File() const { return file_.c_str(); }

  private:
    std::string path_;
    std::string file_;       // composed beforehand: a destructor must not need memory
    std::string left_over_;  // of a creation that failed
    bool made_ = false;
};

// Returns true when only root can have written to the file, and its mode grants no more than it should.
bool IsOurs(const struct stat &st, mode_t mode)
{
    return st.st_uid == 0 && st.st_nlink == 1 && (st.st_mode & 07777 & ~mode) == 0;
}

}  // namespace

BtreeFile LookAtBtreeFile(const char *path, const StoreAccess &access, StoreFile &file) noexcept
{
    struct stat st;
    if (::lstat(path, &st) != 0)
        return errno == ENOENT ? BtreeFile::missing : BtreeFile::unreadable;
    if (!S_ISREG(st.st_mode) || (access.is_ours && !IsOurs(st, access.mode)))
        return BtreeFile::foreign;
    const Fd fd = OpenFd(path, O_RDONLY | O_NOFOLLOW);
    if (!fd || ::fstat(fd.Get(), &st) != 0)
        return BtreeFile::unreadable;
    if (!S_ISREG(st.st_mode) || (access.is_ours && !IsOurs(st, access.mode)))
        return BtreeFile::foreign;
    if (const BtreeFile content = LookAtContent(fd.Get(), st.st_size); content != BtreeFile::store)
        return content;
    // Not when it has that mode already: setting it would change the time stamp by which the seal knows the file.
    if (access.mode != 0 && ::geteuid() == 0 && (st.st_mode & 07777) != access.mode)
        ::fchmod(fd.Get(), access.mode);
    file = {st.st_dev, st.st_ino};
    return BtreeFile::store;
}

bool CreateBtreeFile(const char *path, bool info, mode_t mode)
{
    const BuildDir dir(path);
    if (!dir)
        return false;
    const Extras *extras = LoadExtras();
    if (!extras)
        return false;
    const NoStoreSync no_sync;
    void *store = extras->open_btree(dir.File(), O_RDWR | O_CREAT, 0600, info);
    if (!store)
        return false;
    const Fd fd = OpenFd(dir.File(), O_RDONLY | O_NOFOLLOW);
    if (extras->close_btree(store) != 0 || !fd)
        return false;
    if (mode != 0 && ::fchmod(fd.Get(), mode) != 0)
        return false;
    return ::link(dir.File(), path) == 0;  // not rename, which would replace a file created there meanwhile
}

}  // namespace tavo
