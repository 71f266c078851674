// The IPv4 addresses of this appliance.
#ifndef FINDHOSTD_OWN_ADDRESSES_H
#define FINDHOSTD_OWN_ADDRESSES_H

#include <array>
#include <cstddef>
#include <ctime>

#include <netinet/in.h>

namespace findhostd {

class OwnAddresses {
  public:
    // Asks the kernel again where the answer is older than a second: a flood of packets must not become one of questions.
    void Refresh();

    bool Has(in_addr address) const noexcept;

    // Our address on the network that an interface shares with the asker; nullptr for an asker from elsewhere.
    const in_addr *Near(unsigned interface, in_addr asker) const noexcept;

  private:
    struct Entry {
        in_addr address;
        in_addr mask;
        unsigned interface;
    };

    std::array<Entry, 64> entries_{};
    size_t count_ = 0;
    time_t asked_ = -1;
};

}  // namespace findhostd

#endif
