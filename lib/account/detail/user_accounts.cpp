// Reads, stores and removes one account in the open stores of the user family.
#include "account/detail/user_accounts.h"

#include "account/detail/account_name.h"
#include "account/detail/account_session.h"
#include "account/detail/id_index.h"
#include "account/detail/misc_line.h"
#include "account/detail/shadow_line.h"
#include "account/detail/user_change.h"
#include "account/detail/user_texts.h"

namespace tavo {
namespace {

constexpr std::string_view kLocked = "*";  // the hash of an account without a shadow line: it allows no login

int Privilege(std::string_view key, const MiscLine &misc)
{
    if (IsDomainName(key))
        return TAVO_USER_PRIVILEGE_DOMAIN;
    return key == WithNul("ADMIN") ? int{TAVO_USER_PRIVILEGE_ADMIN} : misc.privilege;
}

// Absent entries are no failure: accounts of the system have no Samba and misc lines.
int DeleteEntry(TAVOBDB *store, std::string_view key)
{
    const int code = Btree::Of(store)->Delete(key);
    return code == ERR_KEY_NOT_FOUND ? 0 : code;
}

}  // namespace

TAVOUSERDB UserDb(const AccountSession &session)
{
    return {session.Store(kNameStore), session.Store(kMiscStore), session.Store(kShadowStore), session.Store(kSmbStore),
            session.Store(kUidStore)};
}

bool IsReservedKey(std::string_view key)
{
    return key == WithNul("ROOT") || key == WithNul("ADMIN");
}

int ReadPasswdLine(const StoreView &names, std::string_view key, PasswdLine &line)
{
    std::string_view value;
    const int code = names.Get(key, value);
    return code == 0 ? ParsePasswdLine(value, line) : code;
}

int ReadPasswdLine(const TAVOUSERDB &db, std::string_view key, PasswdLine &line)
{
    return ReadPasswdLine(*Btree::Of(db.pName), key, line);
}

int ReadUser(const AccountSession &session, std::string_view key, TAVOUSER **user)
{
    PasswdLine passwd;
    ShadowLine shadow;
    MiscLine misc;
    shadow.hash = kLocked;
    int code = ReadPasswdLine(*session.View(kNameStore), key, passwd);
    if (code != 0)
        return code == ERR_KEY_NOT_FOUND ? int{ERR_NO_SUCH_USER} : code;
    if ((code = ReadOptional(*session.View(kShadowStore), key, ParseShadowLine, shadow)) != 0 ||
        (code = ReadOptional(*session.View(kMiscStore), key, ParseMiscLine, misc)) != 0)
        return code;
    if (TAVOUserAlloc(user, passwd.name.c_str(), shadow.hash.c_str(), passwd.uid, passwd.gid,
                      passwd.description.c_str(), passwd.home.c_str(), passwd.shell.c_str(), shadow.expire,
                      shadow.cannot_change, misc.mail.c_str(), Privilege(key, misc)) != 0)
        return tavoerrno;
    return 0;
}

int ReadPrivilege(const AccountSession &session, std::string_view key, int32_t &privilege)
{
    PasswdLine passwd;
    MiscLine misc;
    int code = ReadPasswdLine(*session.View(kNameStore), key, passwd);
    if (code == 0)
        code = ReadOptional(*session.View(kMiscStore), key, ParseMiscLine, misc);
    if (code != 0)
        return code == ERR_KEY_NOT_FOUND ? int{ERR_NO_SUCH_USER} : code;
    privilege = Privilege(key, misc);
    return 0;
}

int FindUserKey(const AccountSession &session, int32_t uid, std::string &key)
{
    const auto has_id = [](std::string_view text, int32_t id) {
        PasswdLine line;
        return ParsePasswdLine(text, line) == 0 && line.uid == id;
    };
    const int code = FindKeyById(*session.View(kUidStore), *session.View(kNameStore), uid, has_id, key);
    return code == ERR_KEY_NOT_FOUND ? int{ERR_NO_SUCH_USER} : code;
}

int StoreUser(const TAVOUSERDB &db, const UserChange &change)
{
    int code = 0;
    const bool renamed = !change.old_key.empty() && change.old_key != change.key;
    for (TAVOBDB *store : {db.pName, db.pMisc, db.pShadow, db.pSmb})
        if (renamed && (code = DeleteEntry(store, change.old_key)) != 0)
            return code;
    if (!change.keep_index) {
        if (!change.old_key.empty() && HasIndex(*Btree::Of(db.pUid), change.old_uid, change.old_key) &&
            (code = DeleteEntry(db.pUid, IdKey(change.old_uid))) != 0)
            return code;
        // Of two accounts with one id the first keeps the index.
        code = RequireAbsent(*Btree::Of(db.pUid), IdKey(change.uid), ERR_KEY_EXISTS);
        if (code == 0)
            code = Btree::Of(db.pUid)->Set(IdKey(change.uid), change.key);
        if (code != 0 && code != ERR_KEY_EXISTS)
            return code;
    }
    const struct {
        TAVOBDB *store;
        const std::string &line;
    } rows[] = {{db.pName, change.passwd_line},
                {db.pMisc, change.misc_line},
                {db.pShadow, change.shadow_line},
                {db.pSmb, change.smb_line}};
    for (const auto &row : rows)
        if ((code = Btree::Of(row.store)->Set(change.key, WithNul(row.line))) != 0)
            return code;
    return 0;
}

int RemoveUser(const TAVOUSERDB &db, const std::string &key, int32_t uid)
{
    if (HasIndex(*Btree::Of(db.pUid), uid, key))
        if (const int code = DeleteEntry(db.pUid, IdKey(uid)))
            return code;
    for (TAVOBDB *store : {db.pName, db.pMisc, db.pShadow, db.pSmb})
        if (const int code = DeleteEntry(store, key))
            return code;
    return 0;
}

}  // namespace tavo
