// Switches the SSH server through its script.
#include "tavo_service.h"

extern "C" int TAVOServiceSSH(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
