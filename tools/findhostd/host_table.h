// The appliances that have answered lately, and the list that is made of them.
#ifndef FINDHOSTD_HOST_TABLE_H
#define FINDHOSTD_HOST_TABLE_H

#include "packet.h"

#include <array>
#include <string>

namespace findhostd {

// Times are monotonic milliseconds.
class HostTable {
  public:
    static constexpr size_t kMost = 1024;          // all addresses of four usual networks
    static constexpr int64_t kKept = 15000;        // how long a host is listed after its last answer
    static constexpr int64_t kCollection = 10000;  // how long a caller waits; entries do not change meanwhile

    // A query of ours. A new collection begins when the last one is over.
    void NoteQuery(int64_t now) noexcept;

    // Within one collection the first answer from an address counts. Returns true when the list has changed: the
    // address is new to it, or its answer differs from the collection before. A full table takes no further hosts.
    bool Put(const Host &host, unsigned interface, int64_t now) noexcept;

    size_t Size() const noexcept { return count_; }

    // One line per host, in the order of arrival: "MODEL,PROTOCOL,NAME,ADDRESS,INTERFACE". Drops outdated hosts.
    std::string Text(int64_t now);

  private:
    struct Entry {
        Host host;
        unsigned interface;  // as the kernel counts them
        unsigned collection;
        int64_t seen;
    };

    void DropOld(int64_t now) noexcept;

    std::array<Entry, kMost> entries_;
    size_t count_ = 0;
    unsigned collection_ = 0;
    int64_t begun_ = -kCollection;
};

}  // namespace findhostd

#endif
