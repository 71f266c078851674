// Switches the Apple file service. Its configuration is rewritten by the share functions, so nothing but the standard
// action belongs here.
#include "tavo_service.h"

extern "C" int TAVOServiceAFP(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
