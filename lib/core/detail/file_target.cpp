// Follows a path to the file that a rewrite replaces.
#include "core/detail/file_target.h"

#include "core/detail/trusted_file.h"

#include <climits>
#include <cstdlib>

namespace tavo {
namespace {

constexpr int kLongestChain = 40;  // as the kernel follows

bool IsLink(const std::string &path)
{
    struct stat st;
    return ::lstat(path.c_str(), &st) == 0 && S_ISLNK(st.st_mode);
}

std::string RealPath(const std::string &path)
{
    char resolved[PATH_MAX];
    return ::realpath(path.c_str(), resolved) ? resolved : std::string();
}

std::string LinkText(const std::string &path)
{
    char text[PATH_MAX];
    const ssize_t length = ::readlink(path.c_str(), text, sizeof text);
    return length > 0 ? std::string(text, static_cast<size_t>(length)) : std::string();
}

}  // namespace

std::string DirectoryOf(const std::string &path)
{
    const size_t slash = path.rfind('/');
    return slash == path.npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

std::string FileTarget(const std::string &path)
{
    std::string at = path;
    for (int links = 0; links <= kLongestChain; ++links) {
        const std::string name = at.substr(at.rfind('/') + 1);  // npos + 1 is 0
        if (name.empty() || name == "." || name == "..")
            return {};
        const std::string directory = RealPath(DirectoryOf(at));
        if (directory.empty())
            return {};
        at = (directory == "/" ? "" : directory) + "/" + name;
        if (!IsLink(at))
            return at;
        if (IsInPublicDirectory(at.c_str()))
            return {};
        const std::string text = LinkText(at);
        if (text.empty())
            return {};
        at = text.front() == '/' ? text : DirectoryOf(at) + "/" + text;
    }
    return {};
}

}  // namespace tavo
