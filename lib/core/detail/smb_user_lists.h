// The user lists in Samba's settings file. Pure text.
#ifndef TAVO_CORE_DETAIL_SMB_USER_LISTS_H
#define TAVO_CORE_DETAIL_SMB_USER_LISTS_H

#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// What becomes of a name in a list: nothing (empty optional), another name, or "" to take it out.
using NameChange = std::function<std::optional<std::string>(std::string_view name, bool is_group)>;

// The file with every name in a user list changed; all else is the same text.
std::string ChangeSmbUserLists(std::string_view text, const NameChange &change);

}  // namespace tavo

#endif
