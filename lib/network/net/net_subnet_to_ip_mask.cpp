// Turns "address/prefix length" into "network/dotted mask".
#include "tavo_net.h"

#include "core/detail/fault.h"
#include "network/detail/ipv4_text.h"

#include <cstdio>
#include <cstdlib>

namespace {

constexpr size_t kBuffer = 64;  // buffer size that every caller passes

// Reads any base of C ("010" is 8, "0x18" is 24), because existing pages and scripts use them. 0 when it is not a
// length.
int ReadLength(const char *text)
{
    char *end = nullptr;
    const long length = std::strtol(text, &end, 0);
    return end == text || *end || length < 1 || length > 32 ? 0 : static_cast<int>(length);
}

}  // namespace

extern "C" int ErrTLIBSubnetToIpMask(char *szIn, char *szOut)
{
    const auto parts = szIn ? tavo::SplitAtSlash(szIn) : std::nullopt;
    if (!parts)
        return Fail(ERR_BAD_PARAMETERS);
    const auto address = tavo::ParseIpv4(parts->before);
    const int length = ReadLength(parts->after.data());  // runs to the end of szIn
    if (!address || length == 0)
        return Fail(ERR_INVALID_NETNAME);

    const tavo::Ipv4 mask = tavo::MaskOf(length);
    const auto network = tavo::Ipv4::FromWord(address->Word() & mask.Word()).octet;
    std::snprintf(szOut ? szOut : szIn, kBuffer, "%d.%d.%d.%d/%d.%d.%d.%d", network[0], network[1], network[2],
                  network[3], mask.octet[0], mask.octet[1], mask.octet[2], mask.octet[3]);
    return 0;
}
