// Makes, changes or dissolves a bond of interfaces.
#include "tavo_net.h"

#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/log.h"
#include "core/detail/text_fields.h"
#include "network/detail/bond_files.h"
#include "network/detail/checkpoint.h"
#include "network/detail/interface_file.h"
#include "network/detail/interface_name.h"
#include "network/detail/kernel_interface.h"
#include "network/detail/net_command.h"
#include "network/detail/network_change.h"

#include <cstring>

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
        for (int other = 0; other < i; ++other) {
            if (std::strcmp(member, aggr.rgszMember[other]) == 0)
                return false;
        }
    }
    return true;
}

// As the kernel has it; an application that died may have left files that say otherwise.
bool IsAsItIs(const TAVONETLINKAGGR &aggr)
{
    const tavo::KeepFault keep;
    TAVONETLINKAGGR now;
    if (TAVONetLinkAggrGet(aggr.szBond, &now) != 0 || now.nMode != aggr.nMode || now.nMember != aggr.nMember)
        return false;
    auto on_file = tavo::MembersOnFile(aggr.szBond);
    if (!on_file)
        return false;
    for (int i = 0; i < aggr.nMember; ++i) {
        if (std::strcmp(now.rgszMember[i], aggr.rgszMember[i]) != 0 || std::erase(*on_file, aggr.rgszMember[i]) != 1)
            return false;
    }
    return on_file->empty() && tavo::HasInterfaceFile(aggr.szBond) == (aggr.nMode != TAVO_NET_AGGR_NONE);
}

// The name of something else that the kernel has, such as a card, whose file would be lost.
bool IsOtherInterface(const char *name)
{
    return !tavo::InterfaceAttribute(name, "type").empty() && tavo::InterfaceAttribute(name, "bonding/mode").empty();
}

// A bond that is dissolved gives its members back as plain interfaces, whether or not the caller named them.
void AddPhysicalMembers(TAVONETLINKAGGR &aggr)
{
    const tavo::KeepFault keep;
    const std::string members = tavo::InterfaceAttribute(aggr.szBond, "bonding/slaves");
    for (const std::string_view member : tavo::SplitFields(members))
        TAVONetLinkAggrOptSlsaveAdd(&aggr, std::string(member).c_str());
}

constexpr const char *kStop = "/etc/rc.network stop > /dev/null 2>&1";
constexpr const char *kStart = "/etc/rc.network start > /dev/null 2>&1";

// Records the state before the change, and the files that it creates. False when it cannot be read.
bool Snapshot(tavo::Checkpoint &before, const TAVONETLINKAGGR &aggr)
{
    before.AddCommand(kStop);
    bool read = before.AddInterfaceFiles() && before.AddFile(tavo::InterfaceFile(aggr.szBond));
    for (int i = 0; i < aggr.nMember; ++i) {
        const std::string file = tavo::InterfaceFile(aggr.rgszMember[i]);
        read = read && before.AddFile(file) && before.AddFile(file + ".saved");
    }
    before.AddCommand(kStart);
    before.AddGateway();
    return read;
}

// 0 or the code of what failed.
int Rebuild(tavo::BondChange &change, tavo::Checkpoint &before)
{
    before.Begin();
    // An address that is left would compete with that of the bond. A stop that only failed is the script's affair.
    constexpr int died_of_signal = 128;  // and more, as a shell reports it
    const int stopped = tavo::RunNetText(kStop);
    if (stopped == -1 || stopped > died_of_signal) {
        before.PutBackAll();
        return ERR_OP_FAILURE;
    }
    const bool written = change.Apply();
    if (!written)
        before.PutBackFiles();
    const bool started = tavo::RunNetText(kStart) == 0;
    // The network that worked before is worth more than half of a new one.
    if (written && !started)
        before.PutBack();
    before.End();
    return !written ? ERR_WRITE_FAILED : started ? 0 : ERR_OP_FAILURE;
}

int Set(TAVONETLINKAGGR aggr)
{
    if (aggr.nMode == TAVO_NET_AGGR_NONE && aggr.fSlaveOption == 0)
        AddPhysicalMembers(aggr);
    tavo::Checkpoint before;
    if (!Snapshot(before, aggr))
        return Fail(ERR_READ_FAILED);
    const std::vector<std::string> members(aggr.rgszMember, aggr.rgszMember + aggr.nMember);
    tavo::BondChange change;
    int code = change.Prepare(aggr.szBond, static_cast<tavo::BondMode>(aggr.nMode), members);
    if (code == 0)
        code = Rebuild(change, before);
    if (code == ERR_WRITE_FAILED)
        LogError("%s:%d Set %s error.", tavo::InterfaceFile(aggr.szBond));
    return code == 0 ? 0 : Fail(code);
}

}  // namespace

extern "C" int TAVONetLinkAggrSet(const TAVONETLINKAGGR *pAggr)
{
    if (!pAggr || !IsSound(*pAggr))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (IsOtherInterface(pAggr->szBond))
            return Fail(ERR_LINK_AGGR_TYPE);
        if (IsAsItIs(*pAggr))
            return 0;
        return tavo::ChangeNetwork([&] { return Set(*pAggr); });
    });
}
