// /etc/hosts: two lines are the appliance's, the rest is the administrator's.
#ifndef TAVO_NETWORK_DETAIL_HOSTS_FILE_H
#define TAVO_NETWORK_DETAIL_HOSTS_FILE_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr const char *kHostsFile = "/etc/hosts";

// The text with "127.0.0.1\tlocalhost" first and "ADDRESS\tNAME" second. Of the old text every line stays except those
// that named localhost by 127.0.0.1, the old host name or the new one. An empty address leaves out the second line.
std::string HostsWithName(std::string_view old_text, std::string_view old_name, std::string_view new_name,
                          std::string_view address);

// The host name that is stored, or the kernel's where none is. Empty when the file cannot be read.
std::optional<std::string> OwnHostName();

// Rewrites the file, by one rename, where it does not have the appliance's name at the address of the first wired card
// that has one, or at 127.0.1.1 where none has. `old_name` is a name that the appliance had before. 0 or a code: where
// name or address cannot be read the file stays. The caller holds the network lock.
int UpdateHosts(std::string_view old_name = {});

// Returns whether UpdateHosts would leave the file unchanged; also when something cannot be read.
bool AreHostsTrue();

}  // namespace tavo

#endif
