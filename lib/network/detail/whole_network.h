// The whole network as steps of a checkpoint.
#ifndef TAVO_NETWORK_DETAIL_WHOLE_NETWORK_H
#define TAVO_NETWORK_DETAIL_WHOLE_NETWORK_H

#include "network/detail/checkpoint.h"

#include <optional>
#include <string>

namespace tavo {

// Which interfaces there are, and which is a part of which; empty when they cannot be read.
std::optional<std::string> NetworkStructure();

// Records every file, setting and interface, and the structure. False when something cannot be read.
bool AddWholeNetwork(Checkpoint &all);

}  // namespace tavo

#endif
