// The interface files of a bond and of its members.
#include "network/detail/bond_files.h"

#include "network/detail/interface_file.h"
#include "network/detail/net_command.h"

#include <cerrno>

#include <sys/stat.h>
#include <unistd.h>

namespace tavo {
namespace {

// What a bond takes over from its first member, so that the appliance keeps its address.
constexpr const char *kAddressKeys[] = {"BOOTPROTO", "IPADDR",   "NETMASK",  "BROADCAST",
                                        "NETWORK",   "IPV6INIT", "IPV6ADDR", "IPV6PREFIXLENG"};

bool Exists(const std::string &path)
{
    struct stat st;
    return ::lstat(path.c_str(), &st) == 0;
}

std::string SavedFile(const std::string &member)
{
    return InterfaceFile(member) + ".saved";
}

bool SaveMember(const std::string &member)
{
    const std::string file = InterfaceFile(member);
    return RunNetCommand("/bin/cp -f %s %s.saved", file, file) == 0;
}

bool WriteBondFile(const std::string &bond, BondMode mode, const std::string &first_member)
{
    std::vector<SettingChange> changes = {
        {"DEVICE", bond}, {"ONBOOT", "yes"}, {"USERCTL", "no"}, {"BONDING_OPTS", std::string(BondOptions(mode))}};
    for (const char *key : kAddressKeys) {
        const std::string value = ReadSetting(SavedFile(first_member), key);
        if (!value.empty())
            changes.push_back({key, value});
    }
    return RewriteSettings(InterfaceFile(bond), changes) == 0;
}

bool WriteMemberFile(const std::string &bond, const std::string &member)
{
    std::vector<SettingChange> changes = {
        {"DEVICE", member}, {"ONBOOT", "yes"}, {"MASTER", bond}, {"SLAVE", "yes"}, {"BOOTPROTO", "none"}};
    for (const char *key : kAddressKeys) {
        if (std::string_view(key) != "BOOTPROTO")
            changes.push_back({key, std::nullopt});
    }
    return RewriteSettings(InterfaceFile(member), changes) == 0;
}

}  // namespace

std::vector<std::string> SavedMembers(const std::vector<std::string> &interfaces)
{
    std::vector<std::string> members;
    for (const std::string &interface : interfaces) {
        if (Exists(SavedFile(interface)))
            members.push_back(interface);
    }
    return members;
}

bool DissolveBond(const std::string &bond, const std::vector<std::string> &members)
{
    bool done = true;
    for (const std::string &member : SavedMembers(members)) {
        const std::string file = InterfaceFile(member);
        done = RunNetCommand("/bin/mv -f %s.saved %s", file, file) == 0 && done;
    }
    return done && (::unlink(InterfaceFile(bond).c_str()) == 0 || errno == ENOENT);
}

bool WriteBond(const std::string &bond, BondMode mode, const std::vector<std::string> &members)
{
    for (const std::string &member : members) {
        if (!SaveMember(member))
            return false;
    }
    if (!WriteBondFile(bond, mode, members.front()))
        return false;
    for (const std::string &member : members) {
        if (!WriteMemberFile(bond, member))
            return false;
    }
    return true;
}

}  // namespace tavo
