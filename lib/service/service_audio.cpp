// Switches the audio station. It plays the files in the index, so the indexing daemon is restarted after it.
#include "tavo_service.h"

#include "service/detail/index_follows.h"

extern "C" int TAVOServiceAudio(const TAVOSERVICE *pService, int action)
{
    const int result = TAVOServiceSTDAction(pService, action);
    if (result == 0)
        tavo::LetIndexFollow(action);
    return result;
}
