// Switches Windows file sharing. Its configuration is rewritten by the share and account functions, so nothing but the
// standard action belongs here.
#include "tavo_service.h"

extern "C" int TAVOServiceSAMBA(const TAVOSERVICE *pService, int action)
{
    return TAVOServiceSTDAction(pService, action);
}
