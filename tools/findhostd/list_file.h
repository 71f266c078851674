// The list of hosts, /tmp/tavods.list.
#ifndef FINDHOSTD_LIST_FILE_H
#define FINDHOSTD_LIST_FILE_H

#include <string_view>

namespace findhostd {

// Replaces the list, and any foreign file at its path: everybody may write to the folder. Returns false with errno.
bool WriteList(std::string_view text);

}  // namespace findhostd

#endif
