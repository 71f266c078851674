// The appliances that answered the last query, and the list that is made of them.
#ifndef FINDHOSTD_HOST_TABLE_H
#define FINDHOSTD_HOST_TABLE_H

#include "packet.h"

#include <array>
#include <string>

namespace findhostd {

class HostTable {
  public:
    static constexpr size_t kMost = 256;

    void Clear() noexcept { count_ = 0; }

    // A host that is there already, by its address, is replaced. False when nothing has changed: it was just so, or the
    // table is full, and whoever came first stays.
    bool Put(const Host &host, unsigned interface) noexcept;

    size_t Size() const noexcept { return count_; }

    // A line a host: "MODEL,PROTOCOL,NAME,ADDRESS,INTERFACE".
    std::string Text() const;

  private:
    struct Entry {
        Host host;
        unsigned interface;  // as the kernel counts them
    };

    std::array<Entry, kMost> entries_;
    size_t count_ = 0;
};

}  // namespace findhostd

#endif
