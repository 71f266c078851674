// The commands of the program.
#ifndef SFDISK_COMMANDS_H
#define SFDISK_COMMANDS_H

#include "options.h"

namespace sfdisk {

// Returns the exit status. Throws Failure.
int RunList(const Options &options);
int RunCreate(const Options &options);
int RunClear(const Options &options);
int RunLabel(const Options &options);

}  // namespace sfdisk

#endif
