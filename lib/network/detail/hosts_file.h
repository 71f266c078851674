// The text of /etc/hosts: two lines are the appliance's, the rest is the administrator's.
#ifndef TAVO_NETWORK_DETAIL_HOSTS_FILE_H
#define TAVO_NETWORK_DETAIL_HOSTS_FILE_H

#include <string>
#include <string_view>

namespace tavo {

// The text with "127.0.0.1\tlocalhost" first and "ADDRESS\tNAME" second. Of the old text every line stays but the ones
// that named localhost by 127.0.0.1, the old host name or the new one. An empty address leaves out the second line.
std::string HostsWithName(std::string_view old_text, std::string_view old_name, std::string_view new_name,
                          std::string_view address);

}  // namespace tavo

#endif
