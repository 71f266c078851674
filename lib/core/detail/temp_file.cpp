// A temporary file's way into its target's place.
#include "core/detail/temp_file.h"

#include <cstdlib>
#include <utility>

namespace tavo {

bool TempFile::CreateBeside(const std::string &target)
{
    Remove();
    path_ = target + ".XXXXXX";
    fd_.Reset(::mkostemp(path_.data(), O_CLOEXEC));
    if (fd_)
        ::fchmod(fd_.Get(), 0600);  // whatever the umask
    else
        path_.clear();
    return static_cast<bool>(fd_);
}

void TempFile::Adopt(Fd fd, std::string path)
{
    Remove();
    fd_ = std::move(fd);
    path_ = std::move(path);
}

bool TempFile::RenameTo(const std::string &target) noexcept
{
    if (::rename(path_.c_str(), target.c_str()) != 0)
        return false;
    path_.clear();
    return true;
}

void TempFile::Remove() noexcept
{
    KeepErrno keep;
    fd_.Reset();
    if (!path_.empty())
        ::unlink(path_.c_str());
    path_.clear();
}

}  // namespace tavo
