// The fields of the lists that user export writes and user import reads.
#ifndef TAVOCTL_USER_COLUMNS_H
#define TAVOCTL_USER_COLUMNS_H

#include <string>
#include <vector>

namespace tavoctl {

enum class WithHashes { no, yes };

inline std::vector<std::string> UserColumns(WithHashes hashes)
{
    std::vector<std::string> columns = {"name",  "uid",  "gid",       "description", "home",
                                        "shell", "mail", "privilege", "expires",     "cannot_change_password"};
    if (hashes == WithHashes::yes)
        columns.insert(columns.end(), {"password_hash", "lm_hash", "nt_hash"});
    return columns;
}

}  // namespace tavoctl

#endif
