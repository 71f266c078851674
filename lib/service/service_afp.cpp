// Switches the Apple file service. The share functions rewrite its configuration, so the standard action is all it
// needs.
#include "tavo_service.h"

extern "C" int TAVOServiceAFP(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
