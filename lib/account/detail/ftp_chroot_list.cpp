// Renames users in the FTP service's chroot list.
#include "account/detail/ftp_chroot_list.h"

#include "core/detail/file_rewrite.h"
#include "core/detail/keep_fault.h"
#include "core/detail/line_reader.h"
#include "tavo_str.h"

namespace tavo {
namespace {

constexpr char kFtpChroot[] = "/etc/ftpchroot";

}  // namespace

bool RenameInFtpChrootList(const std::string &old_name, const std::string &new_name)
{
    const KeepFault keep;
    FileRewrite file;
    if (file.Open(kFtpChroot) != 0)
        return file.IsMissing();
    std::string text;
    if (!file.Read(text))
        return false;
    std::string changed;
    bool found = false;
    for (std::string_view rest = text; !rest.empty();) {
        const std::string_view line = TakeWholeLine(rest);
        const std::string name(WithoutNewline(line));
        if (TLIBUnicodeUTF8StrCaseCmp(name.c_str(), old_name.c_str()) == 0)
            found = true;
        else
            changed.append(line);
    }
    if (!found)
        return true;
    if (!changed.empty() && !changed.ends_with('\n'))
        changed += '\n';
    return file.Replace(changed.append(new_name) += '\n') == 0;
}

}  // namespace tavo
