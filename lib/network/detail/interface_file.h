// The configuration file of an interface, /etc/sysconfig/network-scripts/ifcfg-NAME, and edits of several settings at once.
#ifndef TAVO_NETWORK_DETAIL_INTERFACE_FILE_H
#define TAVO_NETWORK_DETAIL_INTERFACE_FILE_H

#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr const char *kInterfaceFolder = "/etc/sysconfig/network-scripts/";
inline constexpr const char *kNetworkFile = "/etc/sysconfig/network";  // GATEWAY, HOSTNAME
inline constexpr const char *kResolverFile = "/etc/resolv.conf";       // name servers; the DHCP client writes it, too

// The name must have passed IsInterfaceName.
std::string InterfaceFile(std::string_view interface);

struct SettingChange {
    std::string_view key;
    std::optional<std::string> value;  // empty: every line of the key goes
};

// The text with every change made: the first line of a key is replaced, its later ones are dropped, and new keys are
// appended in the order of the changes.
std::string EditSettings(std::string_view text, std::span<const SettingChange> changes);

// The same in a file, by one safe rewrite; a file that does not exist is created. 0 or the code of what failed.
int RewriteSettings(const std::string &path, std::span<const SettingChange> changes);

// The value of a key, "" when it is absent; empty when the file is there and cannot be read.
std::optional<std::string> TryReadSetting(const std::string &path, const char *key);

// The value of a key; empty when it is absent, or does not fit 255 bytes. Leaves the error state alone.
std::string ReadSetting(const std::string &path, const char *key);

}  // namespace tavo

#endif
