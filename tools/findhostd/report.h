// The reports of the part that listens to the network to the part that writes the list. Each is one message of a packet
// socket.
#ifndef FINDHOSTD_REPORT_H
#define FINDHOSTD_REPORT_H

#include "packet.h"

#include <type_traits>

namespace findhostd {

struct Report {
    enum Kind : uint32_t {
        query_sent = 1,  // a query of ours: its sender wants a list
        host_found = 2,
    };

    uint32_t kind;
    uint32_t interface;
    Host host;  // of a host that was found
};

static_assert(std::is_trivially_copyable_v<Report>);

}  // namespace findhostd

#endif
