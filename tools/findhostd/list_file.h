// The list of hosts, /tmp/tavods.list.
#ifndef FINDHOSTD_LIST_FILE_H
#define FINDHOSTD_LIST_FILE_H

#include <string_view>

namespace findhostd {

// Puts a new list in the place of the old one, whatever stands there: anybody may write to the folder. False with errno.
bool WriteList(std::string_view text);

}  // namespace findhostd

#endif
