// Bringing the network to what a document says.
#ifndef TAVOCTL_NET_APPLY_H
#define TAVOCTL_NET_APPLY_H

#include "frame/verb.h"
#include "network/net_document.h"

namespace tavoctl {

// A fact of the document that the network does not have yet, in its files or in the kernel.
struct NetDifference {
    std::string card;  // "" for the appliance as a whole
    const NetItem *item;
    Cell before, after;
};

struct NetPlan {
    NetDocument wanted;
    std::vector<NetDifference> differences;
};

// Looks at the document and notes in the call what differs; throws a Failure for what is refused.
NetPlan PlanNet(Call &call, const std::string &text);

// All of it, or nothing and a Failure. `probe`: asks by ARP first whether another host uses a new address.
void CarryOut(const NetPlan &plan, bool probe, const std::optional<int64_t> &trial_seconds);

}  // namespace tavoctl

#endif
