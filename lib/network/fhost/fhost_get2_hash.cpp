// Reads the collected list of hosts into a hash.
#include "tavo_fhost.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/log.h"
#include "network/detail/discovery_daemon.h"
#include "network/detail/host_list.h"

#include <string>

#include <unistd.h>

namespace {

class DeleteList {
  public:
    DeleteList() = default;
    ~DeleteList() { ::unlink(tavo::kHostListTaken); }
    DeleteList(const DeleteList &) = delete;
    DeleteList &operator=(const DeleteList &) = delete;
};

// False when memory runs out.
bool AddHost(TLIBSZHASH **hosts, const tavo::HostLine &line)
{
    const std::string address(line.address);
    const std::string key = std::string(line.name) + "(" + address + ")";
    return TLIBSzHashSetValue(hosts, key.c_str(), address.c_str()) >= 0;
}

}  // namespace

extern "C" int TAVOFHOSTGet2Hash(TLIBSZHASH **ppshHosts)
{
    if (!ppshHosts || !*ppshHosts)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd list = tavo::OpenHostList(tavo::kHostListTaken);
        if (!list)
            return FailNone(ERR_OPEN_FAILED);
        const DeleteList always;

        tavo::LineReader reader(list.Get());
        for (std::string_view text; reader.Next(text);) {
            const tavo::HostLine line = tavo::ParseHostLine(tavo::TrimSetting(text));
            switch (line.kind) {
            case tavo::HostLineKind::host:
                if (!AddHost(ppshHosts, line))
                    return Fail(ERR_OUT_OF_MEMORY);
                break;
            case tavo::HostLineKind::too_few_fields:
                LogError("%s:%d field number < 5");
                break;
            case tavo::HostLineKind::no_model:
                LogError("%s:%d model number == 0");
                break;
            case tavo::HostLineKind::bad_address:
                LogError("%s:%d not an address");
                break;
            case tavo::HostLineKind::other_protocol:
                break;
            }
        }
        if (reader.Failed())
            return Fail(ERR_READ_FAILED);
        return TLIBSzHashPairNum(*ppshHosts);
    });
}
