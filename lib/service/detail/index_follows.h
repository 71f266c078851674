// The indexing daemon reads at its start which services want an index.
#ifndef TAVO_SERVICE_DETAIL_INDEX_FOLLOWS_H
#define TAVO_SERVICE_DETAIL_INDEX_FOLLOWS_H

#include "tavo_service.h"

namespace tavo {

// Restarts the daemon after an action that started or stopped such a service. Its failure does not fail the service.
inline void LetIndexFollow(int action)
{
    if (action <= TAVO_SERVICE_RESTART)
        TAVONetService(TAVO_DAEMON_INDEX, TAVO_DAEMON_RESTART);
}

}  // namespace tavo

#endif
