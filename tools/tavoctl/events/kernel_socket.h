// A netlink socket that the kernel announces things on.
#ifndef TAVOCTL_KERNEL_SOCKET_H
#define TAVOCTL_KERNEL_SOCKET_H

#include "frame/failure.h"
#include "frame/files.h"

#include <cerrno>
#include <cstdint>
#include <optional>
#include <string>

#include <linux/netlink.h>
#include <sys/socket.h>

namespace tavoctl {

class KernelSocket {
  public:
    KernelSocket(int protocol, uint32_t groups)
        : socket_(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, protocol))
    {
        sockaddr_nl address = {};
        address.nl_family = AF_NETLINK;
        address.nl_groups = groups;
        if (!socket_.IsOpen() || ::bind(Get(), reinterpret_cast<sockaddr *>(&address), sizeof address) != 0)
            throw SystemFailure("listen to the kernel", errno);
    }

    int Get() const { return socket_.Get(); }

    // The next message from the kernel itself; nothing when there is none.
    std::optional<std::string> Receive() const
    {
        std::string bytes(size_t{1} << 16, '\0');
        for (;;) {
            sockaddr_nl sender = {};
            socklen_t size = sizeof sender;
            const ssize_t count =
                ::recvfrom(Get(), bytes.data(), bytes.size(), 0, reinterpret_cast<sockaddr *>(&sender), &size);
            // Too many events at once: some are lost, the following ones are not.
            if (count < 0 && (errno == EINTR || errno == ENOBUFS))
                continue;
            if (count < 0)
                return std::nullopt;
            if (sender.nl_pid != 0)
                continue;  // a program's
            bytes.resize(static_cast<std::size_t>(count));
            return bytes;
        }
    }

  private:
    Descriptor socket_;
};

}  // namespace tavoctl

#endif
