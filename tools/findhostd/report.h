// What the part that listens to the network tells the part that writes the list. Each is one message of a socket that
// keeps them apart.
#ifndef FINDHOSTD_REPORT_H
#define FINDHOSTD_REPORT_H

#include "packet.h"

#include <type_traits>

namespace findhostd {

struct Report {
    enum Kind : uint32_t {
        query_sent = 1,   // a query of ours: a new list begins
        query_again = 2,  // the same once more, or another program's soon after: the list may have been taken meanwhile
        host_found = 3,
    };

    uint32_t kind;
    uint32_t interface;
    Host host;  // of a host that was found
};

static_assert(std::is_trivially_copyable_v<Report>);

}  // namespace findhostd

#endif
