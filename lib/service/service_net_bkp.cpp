// Switches network backup. The dispatcher hands its daemon to the backup module, TAVONetBkpService.
#include "tavo_service.h"

extern "C" int TAVOServiceNetBkp(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
