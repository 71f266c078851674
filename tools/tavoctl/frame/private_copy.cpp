// A copy of a file in a directory of its own.
#include "frame/private_copy.h"

#include "frame/failure.h"
#include "frame/files.h"
#include "frame/unified_diff.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>

#include <sys/stat.h>
#include <unistd.h>

namespace tavoctl {
namespace {

// True when it is there; a file that could not be made is a failure now, not when it is meant seriously.
bool Exists(const std::string &path)
{
    struct stat state = {};
    if (::stat(path.c_str(), &state) == 0)
        return true;
    if (errno != ENOENT)
        throw SystemFailure("read " + path, errno);
    const std::filesystem::path folder = std::filesystem::absolute(path).parent_path();
    if (::eaccess(folder.c_str(), W_OK) != 0)
        throw Failure{.attempted = "create " + path, .reason = folder.string() + ": " + std::strerror(errno)};
    return false;
}

}  // namespace

PrivateCopy::PrivateCopy(std::string original) : original_(std::move(original)), existed_(Exists(original_))
{
    if (existed_)
        text_ = ReadWhole(original_);
    char folder[] = "/tmp/tavoctl.XXXXXX";
    if (!::mkdtemp(folder))
        throw Failure{.attempted = "make a private copy of " + original_, .reason = std::strerror(errno)};
    folder_ = folder;
    copy_ = folder_ + "/copy";
    if (!existed_)
        return;
    std::ofstream out(copy_, std::ios::binary);
    if (!(out << text_).flush()) {
        std::filesystem::remove_all(folder_);
        throw Failure{.attempted = "make a private copy of " + original_, .reason = "there is no room in /tmp"};
    }
}

PrivateCopy::~PrivateCopy()
{
    std::error_code ignored;
    std::filesystem::remove_all(folder_, ignored);
}

std::string PrivateCopy::Difference() const
{
    const bool exists = std::filesystem::exists(copy_);
    return UnifiedDiff(text_, exists ? ReadWhole(copy_) : "", existed_ ? original_ : "/dev/null", original_);
}

}  // namespace tavoctl
