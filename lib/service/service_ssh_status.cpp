// Checks whether the SSH server is enabled and running.
#include "tavo_service.h"

extern "C" int TAVOServiceSSHStatus(const TAVOSERVICE *pService)
{
    return TAVOServiceSTDStatus(pService);
}
