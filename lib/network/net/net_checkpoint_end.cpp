// Ends a checkpoint and keeps the present network.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/network_change.h"
#include "network/detail/network_checkpoint.h"

extern "C" int TAVONetCheckpointEnd(void)
{
    return Guard([] {
        return tavo::ChangeNetwork([] {
            const int code = tavo::EndNetworkCheckpoint();
            return code == 0 ? 0 : Fail(code);
        });
    });
}
