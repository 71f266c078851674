// Lists the bonds that the kernel has.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/text_fields.h"
#include "network/detail/kernel_interface.h"

extern "C" int TAVONetLinkAggrEnum(TLIBSZLIST **ppBonds)
{
    if (!ppBonds || !*ppBonds)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        // Without the file the driver is not loaded, and there is no bond.
        const std::string masters = tavo::ReadKernelFile("/sys/class/net/bonding_masters").value_or("");
        int count = 0;
        for (const std::string_view bond : tavo::SplitFields(masters)) {
            if (TLIBSzListPush(ppBonds, std::string(bond).c_str()) < 0)
                return Fail(ERR_OUT_OF_MEMORY);
            ++count;
        }
        return count;
    });
}
