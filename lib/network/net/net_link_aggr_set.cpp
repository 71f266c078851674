// Makes, changes or dissolves a bond of interfaces.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/lock_hold.h"
#include "core/detail/log.h"
#include "network/detail/bond_files.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"
#include "network/detail/network_lock.h"

#include <cstring>
#include <filesystem>

namespace {

constexpr int kModes = 4;

bool IsSound(const TAVONETLINKAGGR &aggr)
{
    if (::strnlen(aggr.szBond, sizeof aggr.szBond) == sizeof aggr.szBond || !tavo::IsInterfaceName(aggr.szBond) ||
        aggr.nMode < 0 || aggr.nMode >= kModes || aggr.nMember < 0 || aggr.nMember > TAVO_NET_MEMBERS ||
        (aggr.nMode != 0 && aggr.nMember == 0))
        return false;
    for (int i = 0; i < aggr.nMember; ++i) {
        const char *const member = aggr.rgszMember[i];
        if (::strnlen(member, sizeof aggr.rgszMember[i]) == sizeof aggr.rgszMember[i] ||
            !tavo::IsInterfaceName(member) || std::strcmp(member, aggr.szBond) == 0)
            return false;
    }
    return true;
}

bool IsAsItIs(const TAVONETLINKAGGR &aggr)
{
    TAVONETLINKAGGR now;
    if (TAVONetLinkAggrGet(aggr.szBond, &now) != 0 || now.nMode != aggr.nMode || now.nMember != aggr.nMember)
        return false;
    for (int i = 0; i < aggr.nMember; ++i) {
        if (std::strcmp(now.rgszMember[i], aggr.rgszMember[i]) != 0)
            return false;
    }
    return aggr.nMode != 0 || tavo::SavedMembers({}).empty();
}

std::vector<std::string> MembersOf(const TAVONETLINKAGGR &aggr)
{
    return {aggr.rgszMember, aggr.rgszMember + aggr.nMember};
}

// Every interface with a file of its own: of an older bond the members are among them.
std::vector<std::string> ConfiguredInterfaces()
{
    constexpr std::string_view stem = "ifcfg-";
    std::vector<std::string> names;
    std::error_code failed;
    for (const auto &entry : std::filesystem::directory_iterator(tavo::kInterfaceFolder, failed)) {
        const std::string file = entry.path().filename();
        if (file.starts_with(stem) && tavo::IsInterfaceName(file.substr(stem.size())) && !file.ends_with(".saved"))
            names.push_back(file.substr(stem.size()));
    }
    return names;
}

// Where writing fails half-way the saved files come back: the network then starts as it was before.
bool WriteFiles(const TAVONETLINKAGGR &aggr)
{
    const std::vector<std::string> interfaces = ConfiguredInterfaces();
    if (!tavo::DissolveBond(aggr.szBond, interfaces))
        return false;
    if (aggr.nMode == 0 || tavo::WriteBond(aggr.szBond, static_cast<tavo::BondMode>(aggr.nMode), MembersOf(aggr)))
        return true;
    tavo::DissolveBond(aggr.szBond, interfaces);
    return false;
}

// A bond that is dissolved gives its members back as plain interfaces, whether or not the caller named them.
void AddPhysicalMembers(TAVONETLINKAGGR &aggr)
{
    const std::string members = tavo::InterfaceAttribute(aggr.szBond, "bonding/slaves");
    for (size_t begin = 0; begin < members.size();) {
        const size_t end = std::min(members.find(' ', begin), members.size());
        TAVONetLinkAggrOptSlsaveAdd(&aggr, members.substr(begin, end - begin).c_str());
        begin = end + 1;
    }
}

}  // namespace

extern "C" int TAVONetLinkAggrSet(const TAVONETLINKAGGR *pAggr)
{
    if (!pAggr || !IsSound(*pAggr))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (IsAsItIs(*pAggr))
            return 0;
        const tavo::LockHold lock(tavo::kNetworkExclusive, tavo::kNetworkSeconds);
        if (!lock)
            return Fail(ERR_LOCK_FAILED);
        TAVONETLINKAGGR aggr = *pAggr;
        if (aggr.nMode == 0 && aggr.fSlaveOption == 0)
            AddPhysicalMembers(aggr);

        tavo::RunNetCommand("/etc/rc.network stop > /dev/null 2>&1");
        const bool written = WriteFiles(aggr);
        const bool started = tavo::RunNetCommand("/etc/rc.network start > /dev/null 2>&1") == 0;
        if (!written) {
            LogError("%s:%d Set %s error.", tavo::InterfaceFile(aggr.szBond));
            return Fail(ERR_WRITE_FAILED);
        }
        if (!started)
            return Fail(ERR_OP_FAILURE);
        return 0;
    });
}
