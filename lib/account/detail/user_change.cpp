// Computes the entries of an account that is added or changed, and refuses invalid ones.
#include "account/detail/user_change.h"

#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/colon_fields.h"
#include "account/detail/misc_line.h"
#include "account/detail/shadow_line.h"
#include "account/detail/smbpasswd_line.h"
#include "account/detail/user_accounts.h"

namespace tavo {
namespace {

// Programs read these lines with buffers of 1024 bytes.
constexpr size_t kLongestField = 512;

const char *Text(const char *text)
{
    return text ? text : "";
}

bool IsPath(std::string_view text)
{
    return text.starts_with('/') && (std::string(text) + '/').find("/../") == std::string::npos;
}

bool FieldsFit(const TAVOUSER &user)
{
    const std::string_view home = Text(user.szHome);
    const std::string_view shell = Text(user.szShell);
    const struct {
        std::string_view text;
        bool colon_ends_it;
    } fields[] = {{Text(user.szDesc), false}, {home, true}, {shell, true}, {Text(user.szMail), true}};
    for (const auto &field : fields)
        if (field.text.size() > kLongestField || !FitsInField(field.text, field.colon_ends_it))
            return false;
    return (home.empty() || IsPath(home)) && (shell.empty() || IsPath(shell)) && user.nUid >= -1 && user.nGid >= -1;
}

struct OldUser {
    PasswdLine passwd;
    ShadowLine shadow;
    SmbpasswdLine smb;
};

Code ReadOld(const TAVOUSERDB &db, std::string_view key, OldUser &old)
{
    Result<PasswdLine> passwd = ReadPasswdLine(db, key);
    if (!passwd)
        return passwd.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    old.passwd = std::move(*passwd);
    old.shadow.hash = "*";
    old.smb.lm_hash = old.smb.nt_hash = kNoSmbHash;
    if (const Code code = ReadOptional(*Btree::Of(db.pShadow), key, ParseShadowLine, old.shadow))
        return code;
    return ReadOptional(*Btree::Of(db.pSmb), key, ParseSmbpasswdLine, old.smb);
}

// A password that is the stored hash stays, with its Samba hashes; any other is clear text.
Code ChoosePassword(const char *password, const OldUser *old, const Hashing &hashing, UserChange &change,
                    std::string &hash, SmbpasswdLine &smb)
{
    if (old && old->shadow.hash == password) {
        hash = old->shadow.hash;
        smb.lm_hash = old->smb.lm_hash;
        smb.nt_hash = old->smb.nt_hash;
        // A change of something else does not let a locked user in again.
        if (IsLockedHash(hash) && HasDisabledFlag(old->smb.flags))
            smb.flags = old->smb.flags;
        return 0;
    }
    if (hashing.method == HashMethod::unknown)
        return ERR_READ_FAILED;
    hash = HashPassword(password, old ? std::string_view(old->shadow.hash) : std::string_view(), hashing.now,
                        hashing.method);
    if (hash.empty())
        return ERR_BAD_PARAMETERS;
    unsigned char digest[16];
    if (TLIBSmbLmHash(password, digest) != 0)
        return tavoerrno;
    smb.lm_hash = SmbHexHash(digest);
    if (TLIBSmbMd4Hash(password, digest) != 0)
        return tavoerrno;
    smb.nt_hash = SmbHexHash(digest);
    change.new_password = true;
    return 0;
}

Code FindOld(const TAVOUSERDB &db, const char *old_name, UserChange &change, OldUser &old)
{
    const std::optional<std::string> key = AccountKey(old_name);
    if (!key || IsDomainName(old_name))  // a domain's account lives there
        return ERR_NO_SUCH_USER;
    if (const Code code = ReadOld(db, *key, old))
        return code;
    change.old_key = *key;
    change.old_name = old.passwd.name;
    change.old_uid = old.passwd.uid;
    change.old_hash = old.shadow.hash;
    change.keep_index = IsReservedKey(*key);
    return change.keep_index && change.key != *key ? ERR_USER_DB_DELETE : ERR_SUCCESS;
}

}  // namespace

Code PrepareUser(const TAVOUSERDB &db, const char *old_name, const TAVOUSER &user, const Hashing &hashing,
                 UserChange &change)
{
    if (!IsAccountName(user.szName, kUserNameChars) || IsDotName(user.szName))
        return ERR_INVALID_USERNAME;
    const std::optional<std::string> key = AccountKey(user.szName);
    if (!key)
        return ERR_INVALID_USERNAME;
    if (!FieldsFit(user))
        return ERR_BAD_PARAMETERS;
    change = {};
    change.key = *key;
    OldUser old;
    if (old_name)
        if (const Code code = FindOld(db, old_name, change, old))
            return code;
    if (change.old_key != change.key)
        if (const Code code = RequireAbsent(*Btree::Of(db.pName), change.key, ERR_USER_EXISTS))
            return code;

    const std::string name = user.szName;
    change.uid = old_name && (user.nUid < 0 || change.keep_index) ? old.passwd.uid : user.nUid;
    if (change.uid < 0 && !old_name)
        return ERR_BAD_PARAMETERS;
    PasswdLine passwd{name,
                      change.uid,
                      user.nGid < 0 ? int32_t{TAVO_USER_GID_DEFAULT} : user.nGid,
                      Text(user.szDesc),
                      *Text(user.szHome) ? user.szHome : kHomes + name,
                      *Text(user.szShell) ? user.szShell : kDefaultShell};
    ShadowLine shadow{name, {}, user.nExpired, user.fCannotChgPasswd != 0};
    SmbpasswdLine smb;
    smb.name = name;
    smb.uid = change.uid;
    smb.changed = SmbChangeTime(hashing.now);
    if (const Code code =
            ChoosePassword(Text(user.szPasswd), old_name ? &old : nullptr, hashing, change, shadow.hash, smb))
        return code;
    change.passwd_line = FormatPasswdLine(passwd);
    change.misc_line = FormatMiscLine({name, user.nPrivilege, Text(user.szMail)});
    change.shadow_line = FormatShadowLine(shadow, hashing.now);
    change.smb_line = FormatSmbpasswdLine(smb);
    return 0;
}

}  // namespace tavo
