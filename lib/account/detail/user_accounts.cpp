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
Code DeleteEntry(TAVOBDB *store, std::string_view key)
{
    return Btree::Of(store)->Delete(key).Renaming(ERR_KEY_NOT_FOUND, ERR_SUCCESS);
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

Result<PasswdLine> ReadPasswdLine(const StoreView &names, std::string_view key)
{
    return ReadLine(names, key, ParsePasswdLine);
}

Result<PasswdLine> ReadPasswdLine(const TAVOUSERDB &db, std::string_view key)
{
    return ReadPasswdLine(*Btree::Of(db.pName), key);
}

Code ReadUser(const AccountSession &session, std::string_view key, TAVOUSER **user)
{
    ShadowLine shadow;
    MiscLine misc;
    shadow.hash = kLocked;
    const Result<PasswdLine> passwd = ReadPasswdLine(*session.View(kNameStore), key);
    if (!passwd)
        return passwd.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    if (const Code code = ReadOptional(*session.View(kShadowStore), key, ParseShadowLine, shadow))
        return code;
    if (const Code code = ReadOptional(*session.View(kMiscStore), key, ParseMiscLine, misc))
        return code;
    if (TAVOUserAlloc(user, passwd->name.c_str(), shadow.hash.c_str(), passwd->uid, passwd->gid,
                      passwd->description.c_str(), passwd->home.c_str(), passwd->shell.c_str(), shadow.expire,
                      shadow.cannot_change, misc.mail.c_str(), Privilege(key, misc)) != 0)
        return tavoerrno;
    return 0;
}

Code ReadPrivilege(const AccountSession &session, std::string_view key, int32_t &privilege)
{
    MiscLine misc;
    const Result<PasswdLine> passwd = ReadPasswdLine(*session.View(kNameStore), key);
    if (!passwd)
        return passwd.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    if (const Code code = ReadOptional(*session.View(kMiscStore), key, ParseMiscLine, misc))
        return code;
    privilege = Privilege(key, misc);
    return 0;
}

Result<std::string> FindUserKey(const AccountSession &session, int32_t uid)
{
    const auto has_id = [](std::string_view text, int32_t id) {
        const Result<PasswdLine> line = ParsePasswdLine(text);
        return line && line->uid == id;
    };
    return FindKeyById(*session.View(kUidStore), *session.View(kNameStore), uid, has_id)
        .Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
}

Code StoreUser(const TAVOUSERDB &db, const UserChange &change)
{
    const bool renamed = !change.old_key.empty() && change.old_key != change.key;
    for (TAVOBDB *store : {db.pName, db.pMisc, db.pShadow, db.pSmb})
        if (const Code code = renamed ? DeleteEntry(store, change.old_key) : Code())
            return code;
    if (!change.keep_index) {
        if (!change.old_key.empty() && HasIndex(*Btree::Of(db.pUid), change.old_uid, change.old_key))
            if (const Code code = DeleteEntry(db.pUid, IdKey(change.old_uid)))
                return code;
        // Of two accounts with one id the first keeps the index.
        Code code = RequireAbsent(*Btree::Of(db.pUid), IdKey(change.uid), ERR_KEY_EXISTS);
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
        if (const Code code = Btree::Of(row.store)->Set(change.key, WithNul(row.line)))
            return code;
    return 0;
}

Code RemoveUser(const TAVOUSERDB &db, const std::string &key, int32_t uid)
{
    if (HasIndex(*Btree::Of(db.pUid), uid, key))
        if (const Code code = DeleteEntry(db.pUid, IdKey(uid)))
            return code;
    for (TAVOBDB *store : {db.pName, db.pMisc, db.pShadow, db.pSmb})
        if (const Code code = DeleteEntry(store, key))
            return code;
    return 0;
}

}  // namespace tavo
