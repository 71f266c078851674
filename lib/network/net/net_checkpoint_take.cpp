// Notes the whole network, so that it can be put back.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "network/detail/network_change.h"
#include "network/detail/network_checkpoint.h"

extern "C" int TAVONetCheckpointTake(void)
{
    return Guard([] {
        return tavo::ChangeNetwork([] {
            const int code = tavo::TakeNetworkCheckpoint();
            return code == 0 ? 0 : Fail(code);
        });
    });
}
