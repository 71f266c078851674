// Checks whether the Apple file service is enabled and running.
#include "tavo_service.h"

extern "C" int TAVOServiceAFPStatus(const TAVOSERVICE *pService)
{
    return TAVOServiceSTDStatus(pService);
}
