// The whole network as steps of a checkpoint.
#include "network/detail/whole_network.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/key_value_line.h"
#include "core/detail/text_fields.h"
#include "network/detail/folder_names.h"
#include "network/detail/interface_file.h"
#include "network/detail/kernel_interface.h"

#include <algorithm>

namespace tavo {
namespace {

// Files and keys that describe the network, besides /etc/sysconfig/network, /etc/hosts and /etc/resolv.conf.
constexpr const char *kFileStems[] = {"ifcfg-", "more-", "search"};
constexpr const char *kKeyTails[] = {"_mtu", "_wol_options"};

// The Ethernet interfaces by name, as /sys/class/net has them; empty when it cannot be read.
std::optional<std::vector<std::string>> Interfaces()
{
    auto names = FolderNames("/sys/class/net/");
    if (!names)
        return std::nullopt;
    std::erase_if(*names, [](const std::string &name) { return InterfaceAttribute(name, "type") != "1"; });
    std::sort(names->begin(), names->end());
    return names;
}

std::string StructureText(const std::vector<std::string> &interfaces)
{
    std::string text;
    for (const std::string &name : interfaces)
        text += name + " " + InterfaceAttribute(name, "iflink") + " " + InterfaceAttribute(name, "bonding/mode") + " " +
                InterfaceAttribute(name, "bonding/slaves") + "\n";
    return text;
}

bool AddFolder(Checkpoint &all)
{
    const auto names = FolderNames(kInterfaceFolder);
    if (!names)
        return false;
    for (const char *stem : kFileStems) {
        std::string there;
        for (const std::string &name : *names) {
            if (!name.starts_with(stem))
                continue;
            if (!all.AddFile(kInterfaceFolder + name))
                return false;
            there += name + "\n";
        }
        all.Add({UndoStep::only_files, kInterfaceFolder, there, stem});
    }
    return true;
}

void AddSettings(Checkpoint &all)
{
    const std::string text = ReadKernelFile(kSettings).value_or("");
    for (const char *tail : kKeyTails) {
        std::string there;
        for (std::string_view rest = text; !rest.empty();) {
            const std::string key(LineKey(TakeLine(rest)));
            if (!key.ends_with(tail))
                continue;
            all.AddSetting(kSettings, key);
            there += key + "\n";
        }
        all.Add({UndoStep::only_settings, kSettings, there, tail});
    }
}

}  // namespace

std::optional<std::string> NetworkStructure()
{
    const auto interfaces = Interfaces();
    return interfaces ? std::optional(StructureText(*interfaces)) : std::nullopt;
}

bool AddWholeNetwork(Checkpoint &all)
{
    const auto interfaces = Interfaces();
    if (!interfaces)
        return false;
    all.Add({UndoStep::structure, {}, StructureText(*interfaces), {}});
    for (const char *path : {kNetworkFile, kResolverFile, "/etc/hosts"}) {
        if (!all.AddFile(path))
            return false;
    }
    if (!AddFolder(all))
        return false;
    AddSettings(all);
    all.AddHostName();
    for (const std::string &interface : *interfaces)
        all.AddLiveCard(interface);
    return true;
}

}  // namespace tavo
