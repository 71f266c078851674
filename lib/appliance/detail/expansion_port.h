// Expansion units as the kernel shows them: a port multiplier on an internal port, in place of a disk.
#ifndef TAVO_APPLIANCE_DETAIL_EXPANSION_PORT_H
#define TAVO_APPLIANCE_DETAIL_EXPANSION_PORT_H

#include "tavo_appliance.h"

namespace tavo {

inline constexpr int kPorts = 26;

// Returns whether /sys shows the machine's disk ports at all.
bool CanSeePorts();

// Ports count from 0 here and from 1 in the kernel.
bool HasPortMultiplier(int port);

// Returns whether the link to the unit has a speed. A unit that is switched off stays listed until the next start.
bool HasLink(int port);

// Fills in the disks of a unit: "/dev/sd", the unit's letter and the disk's.
void ListUnitDisks(TAVOEBOX &box);

}  // namespace tavo

#endif
