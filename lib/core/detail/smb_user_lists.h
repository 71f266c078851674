// The user lists in Samba's settings file. Pure text.
#ifndef TAVO_CORE_DETAIL_SMB_USER_LISTS_H
#define TAVO_CORE_DETAIL_SMB_USER_LISTS_H

#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace tavo {

// Maps a name in a list: nothing (empty optional) keeps it, another name replaces it, "" removes it.
using NameChange = std::function<std::optional<std::string>(std::string_view name, bool is_group)>;

// Returns the file with the names in its user lists changed; all other text is unchanged.
std::string ChangeSmbUserLists(std::string_view text, const NameChange &change);

}  // namespace tavo

#endif
