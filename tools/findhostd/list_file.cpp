// The list of hosts, /tmp/tavods.list.
#include "list_file.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace findhostd {
namespace {

constexpr const char *kList = "/tmp/tavods.list";

// A foreign folder at the list's path cannot be replaced by a file, so it is renamed.
bool MoveFolderAside()
{
    char aside[] = "/tmp/.tavods.aside.XXXXXX";
    return ::mkdtemp(aside) && std::rename(kList, aside) == 0;
}

bool PutInPlace(const char *temp)
{
    if (std::rename(temp, kList) == 0)
        return true;
    return errno == EISDIR && MoveFolderAside() && std::rename(temp, kList) == 0;
}

bool WriteAll(int fd, std::string_view text)
{
    while (!text.empty()) {
        const ssize_t put = ::write(fd, text.data(), text.size());
        if (put < 0 && errno == EINTR)
            continue;
        if (put < 0)
            return false;
        text.remove_prefix(static_cast<size_t>(put));
    }
    return true;
}

}  // namespace

bool WriteList(std::string_view text)
{
    // A new file of our own; the rename replaces a link or a foreign file without following it.
    char temp[] = "/tmp/.tavods.list.XXXXXX";
    const int fd = ::mkostemp(temp, O_CLOEXEC);
    if (fd < 0)
        return false;
    const bool written = WriteAll(fd, text) && ::fchmod(fd, 0644) == 0;
    const bool done = ::close(fd) == 0 && written && PutInPlace(temp);
    if (!done) {
        const int error = errno;
        ::unlink(temp);
        errno = error;
    }
    return done;
}

}  // namespace findhostd
