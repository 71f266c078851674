// Returns whether this machine is an appliance.
#include "frame/host.h"

#include "frame/failure.h"

#include <string>

#include <unistd.h>

namespace tavoctl {

bool IsAppliance()
{
    return ::access(defaults_file, F_OK) == 0;
}

void RefuseForeignHost()
{
    FailIf(!IsAppliance(), "change this machine", std::string("it is not an appliance: there is no ") + defaults_file,
           "--force-host does it anyway");
}

}  // namespace tavoctl
