// Lists the name servers.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/text_fields.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"

#include <string>

extern "C" int TAVONetDNSGet(TLIBSZLIST **ppServers)
{
    if (!ppServers || !*ppServers)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const auto text = tavo::ReadKernelFile(tavo::kResolverFile);
        if (!text)
            return Fail(ERR_OPEN_FAILED);
        int count = 0;
        for (std::string_view rest = *text; !rest.empty();) {
            const auto field = tavo::SplitFields(tavo::TakeLine(rest));
            if (field.size() < 2 || field[0] != "nameserver")
                continue;
            if (TLIBSzListPush(ppServers, std::string(field[1]).c_str()) < 0)
                return Fail(ERR_OUT_OF_MEMORY);
            ++count;
        }
        return count;
    });
}
