// Switches Windows file sharing. The share and account functions rewrite its configuration, so the standard action is
// all it needs.
#include "tavo_service.h"

extern "C" int TAVOServiceSAMBA(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
