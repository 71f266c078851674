// Switches network backup. The dispatcher passes its daemon on to the backup module, TAVONetBkpService.
#include "tavo_service.h"

extern "C" int TAVOServiceNetBkp(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
