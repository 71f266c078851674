// Restores the whole network to the state of its checkpoint.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/network_change.h"
#include "network/detail/network_checkpoint.h"

extern "C" int TAVONetCheckpointPutBack(void)
{
    return Guard([] {
        return tavo::ChangeNetwork([] {
            const int code = tavo::PutBackNetworkCheckpoint();
            return code == 0 ? 0 : Fail(code);
        });
    });
}
