// Returns whether this machine is an appliance.
#ifndef TAVOCTL_HOST_H
#define TAVOCTL_HOST_H

namespace tavoctl {

// An appliance carries its model's capabilities in a file; a person's own computer does not.
inline constexpr char settings_file[] = "/etc/tavoinfo.conf";
inline constexpr char defaults_file[] = "/etc.defaults/tavoinfo.conf";

bool IsAppliance();

// Throws a Failure on any other machine.
void RefuseForeignHost();

}  // namespace tavoctl

#endif
