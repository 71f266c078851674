// Brings in line what else on the appliance knows users by name.
#include "account/detail/user_follow_up.h"

#include "account/detail/account_name.h"
#include "core/detail/file_rewrite.h"

namespace tavo {
namespace {

constexpr char kAfpdConf[] = "/usr/tavo/etc/afpd.conf";
constexpr std::string_view kGuestModule = "uams_guest.so";
constexpr std::string_view kNoGuestModule = "uams_noguest.so";

void ReplaceAll(std::string &text, std::string_view from, std::string_view to)
{
    for (size_t at = 0; (at = text.find(from, at)) != text.npos; at += to.size())
        text.replace(at, from.size(), to);
}

}  // namespace

bool AddNameChange(HashOwner &names, const std::string &old_name, const std::string &new_name)
{
    if (!names)
        names.Reset(PshTLIBSzHashAlloc(1024));
    const std::optional<std::string> key = AccountKey(old_name);
    return names && key && TLIBSzHashSetValue(names.Addr(), key->c_str(), new_name.c_str()) >= 0;
}

int SetGuestAfpd(bool may_enter)
{
    FileRewrite file;
    const int code = file.Open(kAfpdConf);
    if (code != 0)
        return file.IsMissing() ? int{ERR_FILE_NOT_FOUND} : code;
    std::string text;
    if (!file.Read(text))
        return ERR_READ_FAILED;
    const std::string before = text;
    if (text.find("-uamlist") != text.npos)
        ReplaceAll(text, may_enter ? kNoGuestModule : kGuestModule, may_enter ? kGuestModule : kNoGuestModule);
    return text == before ? 0 : file.Replace(text);
}

}  // namespace tavo
