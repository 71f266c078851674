// Renames users in the FTP service's chroot list.
#include "account/detail/ftp_chroot_list.h"

namespace tavo {

bool FtpChrootList::Rename(const std::string &old_name, const std::string &new_name)
{
    if (!names_.Read())
        return false;
    if (names_.Change(old_name, [](std::string_view) { return std::string(); }))
        names_.Append(new_name);
    return true;
}

}  // namespace tavo
