// Stores password hashes that were computed elsewhere.
#include "tavo_appliance.h"
#include "tavo_lock.h"
#include "tavo_user.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/colon_fields.h"
#include "account/detail/shadow_line.h"
#include "account/detail/smbpasswd_line.h"
#include "account/detail/user_accounts.h"
#include "account/detail/user_dump.h"
#include "account/detail/user_lines.h"
#include "account/detail/user_texts.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"

namespace {

struct NewHashes {
    const char *unix_hash;
    const char *lm_hash;
    const char *nt_hash;
};

// The two lines with the new hashes.
tavo::Result<tavo::UserLines> ReplaceHashes(const TAVOUSERDB &db, std::string_view key, const NewHashes &hashes)
{
    if (!tavo::FitsInField(hashes.unix_hash, true) || !tavo::IsSmbHash(hashes.lm_hash) ||
        !tavo::IsSmbHash(hashes.nt_hash))
        return ERR_BAD_PARAMETERS;
    const tavo::Result<tavo::PasswdLine> account = tavo::ReadPasswdLine(db, key);
    if (!account)
        return account.Failure().Renaming(ERR_KEY_NOT_FOUND, ERR_NO_SUCH_USER);
    const tavo::Result<std::string_view> line = tavo::Btree::Of(db.pShadow)->Get(key);
    if (!line)
        return line.Failure();
    tavo::Result<std::string> shadow = tavo::ReplaceShadowHash(*line, hashes.unix_hash);
    if (!shadow)
        return shadow.Failure();
    tavo::SmbpasswdLine samba;  // an account of the system gets its first Samba password
    samba.name = account->name;
    samba.uid = account->uid;
    samba.changed = tavo::SmbChangeTime(::time(nullptr));
    if (const tavo::Code code = tavo::ReadOptional(*tavo::Btree::Of(db.pSmb), key, tavo::ParseSmbpasswdLine, samba))
        return code;
    samba.lm_hash = hashes.lm_hash;
    samba.nt_hash = hashes.nt_hash;
    return tavo::UserLines{std::move(*shadow), tavo::FormatSmbpasswdLine(samba)};
}

struct Outcome {
    int code = 0;
    bool damaged = false;
};

Outcome SetHashes(const TAVOUSERDB &db, const char *name, const NewHashes &hashes)
{
    const std::optional<std::string> key = tavo::AccountKey(name);
    if (!key)
        return {ERR_INVALID_USERNAME};
    if (tavo::IsDomainName(name))
        return {ERR_NO_SUCH_USER};  // its password is kept in the domain
    const tavo::Result<tavo::UserLines> lines = ReplaceHashes(db, *key, hashes);
    if (!lines)
        return {lines.Failure()};
    tavo::Code code = tavo::Btree::Of(db.pShadow)->Set(*key, tavo::WithNul(lines->shadow));
    if (code == 0)
        code = tavo::Btree::Of(db.pSmb)->Set(*key, tavo::WithNul(lines->samba));
    return {code, code != 0};
}

}  // namespace

extern "C" int TAVOUserSetPasswd(const TAVOUSER *const *rgpUser, const char *const *rgszHash,
                                 const char *const *rgszLmHash, const char *const *rgszNtHash, int nUser)
{
    if (!rgpUser || !rgszHash || !rgszLmHash || !rgszNtHash || nUser < 0)
        return Fail(ERR_BAD_PARAMETERS);
    if (nUser == 0)
        return 0;
    return Guard([&] {
        tavo::AccountTransaction change(tavo::kUserKind);
        if (const tavo::Code code = change.Begin(TAVO_LOCK_USER))
            return Fail(code);
        TAVOUSERDB db = tavo::UserDb(change.Session());
        bool changed = false;
        change.Session().BeginChange();
        for (int i = 0; i < nUser; ++i) {
            if (!rgpUser[i] || !rgpUser[i]->szName || !rgszHash[i] || !rgszLmHash[i] || !rgszNtHash[i])
                continue;
            const Outcome outcome = SetHashes(db, rgpUser[i]->szName, {rgszHash[i], rgszLmHash[i], rgszNtHash[i]});
            if (outcome.code != 0) {
                Fail(outcome.code);
                LogNotice("%s:%d Failed to set the password of [%s], tavoerr=0x%04X", rgpUser[i]->szName, outcome.code);
            }
            if (outcome.damaged)
                return -1;
            changed = changed || outcome.code == 0;
        }
        return tavo::FinishUsers(change, changed);
    });
}
