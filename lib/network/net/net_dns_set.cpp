// Stores the name servers.
#include "tavo_net.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/ipv4_text.h"
#include "network/detail/network_change.h"

#include <cerrno>
#include <cstring>
#include <string>

#include <arpa/inet.h>

namespace {

// The address as the resolver reads it ("010" is 8); empty for other text.
std::string ServerText(const char *text)
{
    if (const auto address = tavo::ParseIpv4(text))
        return tavo::IsHostAddress(*address) ? address->Text() : "";
    in6_addr address;
    return ::inet_pton(AF_INET6, text, &address) == 1 ? text : "";
}

// The log tells which step failed; the old file is unchanged whichever it was.
void LogFailure(int code)
{
    if (code == ERR_RENAME_FAILED)
        LogError("%s (%d) rename(%s, %s) failed.(%s)", "/etc/resolv.conf.tmp", tavo::kResolverFile,
                 std::strerror(errno));
    else if (code == ERR_WRITE_FAILED)
        LogError("%s (%d) fflush failed.(%s)", std::strerror(errno));
}

int Write(const std::string &text)
{
    tavo::Checkpoint before;
    before.AddFile(tavo::kResolverFile);
    before.Begin();
    tavo::FileRewrite rewrite;
    int code = rewrite.Open(tavo::kResolverFile);
    if (code == 0 || rewrite.IsMissing())
        code = rewrite.Replace(text, 0644);
    const int error = errno;
    before.End();
    errno = error;
    if (code == 0)
        return 0;
    LogFailure(code);
    return Fail(code);
}

}  // namespace

extern "C" int TAVONetDNSSet(const TLIBSZLIST *pServers)
{
    if (!pServers)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        std::string text;
        for (int i = 0; i < pServers->nItem; ++i) {
            const char *const given = SzTLIBSzListGet(pServers, i);
            const std::string server = ServerText(given);
            if (server.empty()) {
                LogError("%s (%d) Bad DNS %s", given);
                return Fail(ERR_INVALID_NETNAME);
            }
            text.append("nameserver\t").append(server).append("\n");
        }
        return tavo::ChangeNetwork([&] { return Write(text); });
    });
}
