// Waits for the DHCPv6 client of an interface to end.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/process_list.h"
#include "core/detail/text_fields.h"
#include "network/detail/interface_name.h"

#include <algorithm>

#include <unistd.h>

namespace {

bool Runs(std::string_view interface)
{
    for (const tavo::Process &process : tavo::ListProcesses()) {
        const auto words = tavo::SplitFields(process.command);
        if (words.empty() || words[0].substr(words[0].rfind('/') + 1) != "dhcp6c")
            continue;
        if (std::find(words.begin() + 1, words.end(), interface) != words.end())
            return true;
    }
    return false;
}

}  // namespace

extern "C" int TAVONetDhcp6Wait(const char *szInterface, int cSeconds)
{
    if (!szInterface || !tavo::IsInterfaceName(szInterface) || cSeconds < 0)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        for (int waited = 0; Runs(szInterface); ++waited) {
            if (waited == cSeconds)
                return Fail(ERR_TIMER_EXPIRED);
            ::sleep(1);
        }
        return 0;
    });
}
