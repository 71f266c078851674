// Account names are compared without regard to case.
#include "account/account_key.h"

#include "tavo_str.h"

namespace tavoctl {

std::string AccountKey(const std::string &name)
{
    constexpr std::size_t growth = 6;  // bytes that one may become in upper case
    std::string key(name.size() * growth + 1, '\0');
    if (TLIBUnicodeUTF8StrUpper(name.c_str(), key.data(), static_cast<int>(key.size())) < 0)
        return name;
    return key.c_str();
}

}  // namespace tavoctl
