// The line between the agent in the guest and the host: frames of one type byte, a 32-bit length and a payload.
#pragma once

#include <string>
#include <string_view>

namespace machine {

struct Frame {
    char type;
    std::string payload;
};

class Channel {
  public:
    explicit Channel(const char *path);
    [[nodiscard]] int Descriptor() const { return descriptor_; }
    // Waits for the host, also through the time in which none is connected.
    Frame Receive() const;
    void Send(char type, std::string_view payload) const;

  private:
    void ReceiveExactly(char *into, size_t size) const;
    void SendExactly(const char *from, size_t size) const;
    int descriptor_;
};

}  // namespace machine
