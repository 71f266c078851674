// The families of commands. A new one is a file of its own in its area, named like the family, and a line in each list.
#ifndef TAVOCTL_FAMILIES_H
#define TAVOCTL_FAMILIES_H

#include "frame/program.h"

namespace tavoctl {

using AddFamily = void(Program &);

AddFamily AddConf;
AddFamily AddSection;
AddFamily AddLock;
AddFamily AddProc;
AddFamily AddDisk;
AddFamily AddPartition;
AddFamily AddRaid;
AddFamily AddLvm;
AddFamily AddVolume;
AddFamily AddStorage;
AddFamily AddUser;
AddFamily AddGroup;
AddFamily AddQuota;
AddFamily AddNet;
AddFamily AddDiscover;
AddFamily AddService;
AddFamily AddState;
AddFamily AddWatch;
AddFamily AddError;
AddFamily AddVersion;

// In the order of the help text.
inline constexpr AddFamily *families[] = {
    AddConf, AddSection, AddLock,  AddProc, AddStorage,  AddVolume,  AddDisk,  AddPartition, AddRaid,  AddLvm,
    AddUser, AddGroup,   AddQuota, AddNet,  AddDiscover, AddService, AddState, AddWatch,     AddError, AddVersion,
};

}  // namespace tavoctl

#endif
