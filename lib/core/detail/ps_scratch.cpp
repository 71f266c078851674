// Creates the scratch file of a search for processes.
#include "core/detail/ps_scratch.h"

#include "tavo_proc.h"

#include "core/detail/open_file.h"

#include <cerrno>

namespace tavo {

PsScratch::PsScratch(std::string path) : path_(std::move(path))
{
    // A file of an earlier process with our pid is removed; files of other users are left alone.
    struct stat st;
    if (::lstat(path_.c_str(), &st) == 0 && st.st_uid == ::geteuid() && !S_ISDIR(st.st_mode))
        ::unlink(path_.c_str());
    fd_ = OpenFd(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    is_taken_ = !fd_ && errno == EEXIST;
    if (is_taken_)
        fd_ = Fd(::mkostemp((path_ += ".XXXXXX").data(), O_CLOEXEC));
}

PsScratch::~PsScratch()
{
    const KeepErrno keep;
    if (fd_)
        TLIBSysRemove(path_.c_str());
}

File PsScratch::Reopen() const
{
    Fd fd = OpenRegular(path_.c_str(), O_RDONLY | O_NOFOLLOW);
    struct stat created, named;
    if (!fd || ::fstat(fd_.Get(), &created) != 0 || ::fstat(fd.Get(), &named) != 0 || created.st_dev != named.st_dev ||
        created.st_ino != named.st_ino)
        return File();
    File stream(::fdopen(fd.Get(), "re"));
    if (stream)
        fd.Release();
    return stream;
}

}  // namespace tavo
