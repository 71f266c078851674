// The steps from the present network to that of a document.
#ifndef TAVOCTL_NET_STEPS_H
#define TAVOCTL_NET_STEPS_H

#include "network/net_document.h"

namespace tavoctl {

// Changes what differs, in the files and in the kernel; throws a Failure at the first thing that fails. The caller
// holds the network lock and puts back.
void ApplyNet(const NetDocument &wanted);

}  // namespace tavoctl

#endif
