// The line between the agent in the guest and the host.
#include "channel.h"

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <system_error>

#include <fcntl.h>
#include <unistd.h>

namespace machine {

Channel::Channel(const char *path) : descriptor_(open(path, O_RDWR | O_CLOEXEC))
{
    if (descriptor_ < 0)
        throw std::system_error(errno, std::generic_category(), path);
}

void Channel::ReceiveExactly(char *into, size_t size) const
{
    while (size > 0) {
        const ssize_t got = read(descriptor_, into, size);
        if (got > 0) {
            into += got;
            size -= static_cast<size_t>(got);
        } else if (got == 0) {
            usleep(2000);  // no host at the other end: a saved machine waits here for the one that wakes it
        } else if (errno != EINTR && errno != EAGAIN) {
            throw std::system_error(errno, std::generic_category(), "read from the host");
        }
    }
}

void Channel::SendExactly(const char *from, size_t size) const
{
    while (size > 0) {
        const ssize_t put = write(descriptor_, from, size);
        if (put > 0) {
            from += put;
            size -= static_cast<size_t>(put);
        } else if (put < 0 && errno != EINTR && errno != EAGAIN) {
            throw std::system_error(errno, std::generic_category(), "write to the host");
        }
    }
}

Frame Channel::Receive() const
{
    char head[5];
    ReceiveExactly(head, sizeof head);
    uint32_t size;  // both ends are little-endian
    memcpy(&size, head + 1, sizeof size);
    Frame frame{head[0], std::string(size, '\0')};
    ReceiveExactly(frame.payload.data(), size);
    return frame;
}

void Channel::Send(char type, std::string_view payload) const
{
    const auto size = static_cast<uint32_t>(payload.size());
    std::string frame(1, type);
    frame.append(reinterpret_cast<const char *>(&size), sizeof size);
    frame.append(payload);
    SendExactly(frame.data(), frame.size());
}

}  // namespace machine
