// Checks whether media sharing for players is enabled and running.
#include "tavo_service.h"

extern "C" int TAVOServiceiTunesStatus(const TAVOSERVICE *pService)
{
    return TAVOServiceSTDStatus(pService);
}
