// The files of other programs that name users and groups.
#include "account/detail/neighbour_files.h"

#include "tavo_error.h"

#include "account/detail/ftp_chroot_list.h"
#include "account/detail/share_groups.h"
#include "core/detail/appliance_paths.h"
#include "core/detail/smb_user_lists.h"

#include <cstdio>

#include <limits.h>
#include <unistd.h>

namespace tavo {
namespace {

constexpr char kAfpdConf[] = "/usr/tavo/etc/afpd.conf";
constexpr std::string_view kGuestModuleName = "uams_guest.so";
constexpr std::string_view kNoGuestModule = "uams_noguest.so";
constexpr mode_t kModeOfNew = 0644;

void ReplaceAll(std::string &text, std::string_view from, std::string_view to)
{
    for (size_t at = 0; (at = text.find(from, at)) != text.npos; at += to.size())
        text.replace(at, from.size(), to);
}

template <class Change>
Code ChangeText(unsigned target, const char *path, AccountCommit &commit, Change change)
{
    FileRewrite file;
    const Code code = file.Open(path);
    if (code != 0)
        return file.IsMissing() ? Code() : code;
    std::string text;
    if (!file.Read(text))
        return ERR_READ_FAILED;
    const std::string changed = change(text);
    return changed == text ? Code() : commit.WriteNeighbour(target, file, changed, kModeOfNew);
}

Code ComposeSambaLists(const NameMap &names, AccountCommit &commit)
{
    return ChangeText(kSambaLists, kSambaFile, commit, [&](std::string_view text) {
        return ChangeSmbUserLists(text, [&](std::string_view name, bool is_group) {
            const std::string *found = names.Find(std::string(is_group ? "@" : "").append(name));
            return found ? std::optional(*found) : std::nullopt;
        });
    });
}

Code ComposeShareLists(const NameMap &names, AccountCommit &commit)
{
    HashOwner hash(PshTLIBSzHashAlloc(1024));
    for (const auto &[key, name] : names.Names())
        if (!hash || TLIBSzHashSetValue(hash.Addr(), key.c_str(), name.c_str()) < 0)
            return ERR_OUT_OF_MEMORY;
    return ChangeText(kShareLists, kShareFile, commit,
                      [&](std::string_view text) { return ChangeShareGroups(text, hash.Get()); });
}

Code ComposeFtpList(const std::vector<NameStep> &steps, AccountCommit &commit)
{
    FtpChrootList list;
    for (const NameStep &step : steps)
        if (!step.new_name.empty() && !list.Rename(step.old_name, step.new_name))
            return ERR_READ_FAILED;
    return list.Compose(kFtpList, commit);
}

Code ComposeBackupUsers(const std::vector<NameStep> &steps, NetBackupUsers &backup, AccountCommit &commit)
{
    bool read = true;
    for (const NameStep &step : steps)
        read = (step.new_name.empty() ? backup.Remove(step.old_name)
                                      : backup.Set(step.old_name, step.new_name, nullptr)) &&
               read;
    return read ? backup.Compose(kBackupUsers, commit) : Code(ERR_READ_FAILED);
}

}  // namespace

void RemoveNeighbourTemporaries() noexcept
{
    for (const char *path : {kSambaFile, kShareFile, kAfpdConf, kFtpChroot, kNetBackupUsers, kRsyncSecrets}) {
        char temporary[PATH_MAX];
        std::snprintf(temporary, sizeof temporary, "%s.tmp", path);
        ::unlink(temporary);
    }
}

Code ComposeBackup(NetBackupUsers &backup, AccountCommit &commit)
{
    const Code code = backup.IsUnreadable() ? Code(ERR_READ_FAILED) : backup.Compose(kBackupUsers, commit);
    if (code != 0)
        commit.Withdraw(kBackupUsers);
    return code;
}

Code ComposeGuestModule(bool may_enter, AccountCommit &commit)
{
    if (::access(kAfpdConf, F_OK) != 0 && errno == ENOENT)
        return ERR_FILE_NOT_FOUND;
    return ChangeText(kGuestModule, kAfpdConf, commit, [&](std::string text) {
        if (text.find("-uamlist") != text.npos)
            ReplaceAll(text, may_enter ? kNoGuestModule : kGuestModuleName,
                       may_enter ? kGuestModuleName : kNoGuestModule);
        return text;
    });
}

Code ComposeNeighbour(unsigned target, const std::vector<NameStep> &steps, NetBackupUsers &backup,
                      AccountCommit &commit)
{
    Code code = 0;
    if (target == kFtpList) {
        code = ComposeFtpList(steps, commit);
    } else if (target == kBackupUsers) {
        code = ComposeBackupUsers(steps, backup, commit);
    } else if (target == kGuestModule) {
        code = steps.empty() ? Code() : ComposeGuestModule(steps.back().new_name == "yes", commit);
    } else {
        NameMap names;
        for (const NameStep &step : steps)
            names.Add(step);
        code = target == kSambaLists ? ComposeSambaLists(names, commit) : ComposeShareLists(names, commit);
    }
    if (code != 0)
        commit.Withdraw(target);
    return code;
}

}  // namespace tavo
