// The files of users and groups as they were.
#include "state/account_files.h"

#include "frame/files.h"

#include <unistd.h>

namespace tavoctl {
namespace {

bool IsThere(const std::string &path)
{
    return ::access(path.c_str(), F_OK) == 0;
}

}  // namespace

AccountFiles::AccountFiles(const UserPlan &plan)
{
    for (const char *path : {"/etc/passwd", "/etc/shadow", "/etc/tavouser.conf", "/usr/tavo/etc/private/smbpasswd",
                             "/etc/group", "/etc/group_desc", "/usr/tavo/etc/smb.conf", "/usr/tavo/etc/share.conf",
                             "/usr/tavo/etc/afpd.conf", "/etc/ftpchroot"})
        files_.push_back({path, IsThere(path) ? std::optional(FileText(path)) : std::nullopt});
    for (const UserChange &change : plan.changes)
        if (const std::string home = "/var/services/homes/" + change.user.name; !change.old_name && !IsThere(home))
            new_homes_.push_back(home);
    sigset_t held;
    ::sigemptyset(&held);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP, SIGQUIT})
        ::sigaddset(&held, signal);
    ::sigprocmask(SIG_BLOCK, &held, &signals_);
}

AccountFiles::~AccountFiles()
{
    ::sigprocmask(SIG_SETMASK, &signals_, nullptr);
}

void AccountFiles::PutBack() const
{
    for (const OldFile &file : files_)
        if (IsThere(file.path) != file.text.has_value() || (file.text && FileText(file.path) != *file.text))
            ReplaceFile(file.path, file.text.value_or(""));
    for (const std::string &home : new_homes_)
        ::rmdir(home.c_str());
}

}  // namespace tavoctl
