// Asks the network for appliances and hands each to a callback as it answers.
#include "tavo_fhost.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/log.h"
#include "network/detail/discovery_daemon.h"
#include "network/detail/host_list.h"

#include <algorithm>
#include <ctime>
#include <string>
#include <vector>

#include <sys/stat.h>
#include <unistd.h>

namespace {

class Hosts {
  public:
    Hosts(TAVOFHOSTCALLBACK callback, void *context) : callback_(callback), context_(context) {}

    // Passes new hosts of the list to the callback. Returns its result, once it is not 0.
    int Read(const char *path)
    {
        const tavo::Fd list = tavo::OpenHostList(path);
        struct stat st;
        // One that is older than the query is what an earlier search left.
        if (!list || ::fstat(list.Get(), &st) != 0 || st.st_mtime + 1 < asked_)
            return 0;
        tavo::LineReader reader(list.Get());
        for (std::string_view text; reader.Next(text);) {
            const auto host = tavo::ParseHost(tavo::TrimSetting(text));
            if (!host || std::find(known_.begin(), known_.end(), host->szIp) != known_.end())
                continue;
            known_.push_back(host->szIp);
            if (const int result = callback_(&*host, context_))
                return result;
        }
        return 0;
    }

    int Count() const { return static_cast<int>(known_.size()); }

  private:
    TAVOFHOSTCALLBACK callback_;
    void *context_;
    const time_t asked_ = std::time(nullptr);
    std::vector<std::string> known_;
};

}  // namespace

extern "C" int TAVOFHOSTEnum(TAVOFHOSTCALLBACK pfnHost, void *pContext, int cSeconds)
{
    if (!pfnHost || cSeconds < 1)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (!tavo::IsDiscoveryAlive()) {
            LogError("%s(%d): findhostd daemon is not running ....");
            if (!tavo::StartDiscovery())
                return Fail(ERR_OP_FAILURE);
        }
        Hosts hosts(pfnHost, pContext);
        const bool sent = ErrFHOSTSendQueryPkt() == 0;
        if (!sent)
            LogError("%s(%d): ErrFHOSTSendQueryPkt() failed!");
        for (int second = 0; second < cSeconds; ++second) {
            ::sleep(1);
            // Another caller may take the list at any moment, and with it who has just been added.
            if (hosts.Read(tavo::kHostList) != 0 || hosts.Read(tavo::kHostListTaken) != 0)
                break;
        }
        // When one interface cannot send, hosts may have answered on the others.
        return sent || hosts.Count() > 0 ? hosts.Count() : Fail(ERR_OP_FAILURE);
    });
}
