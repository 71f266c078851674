// Returns the number of internal bays of the model.
#include "tavo_appliance.h"

#include "core/detail/guard.h"
#include "core/detail/model_setting.h"

extern "C" int TAVOMaxDiskGet(void)
{
    constexpr uint64_t usual = 4;
    constexpr uint64_t most = 10;  // "/dev/sda" to "/dev/sdj"; the letters after them are external ports
    return Guard([&] {
        const uint64_t bays = tavo::ModelNumber("maxdisks").value_or(usual);
        return static_cast<int>(bays == 0 ? usual : bays < most ? bays : most);
    });
}
