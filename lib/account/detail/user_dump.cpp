// Writes the four text files of the user family from its open stores.
#include "account/detail/user_dump.h"

#include "account/detail/account_name.h"
#include "account/detail/family_dump.h"
#include "account/detail/id_index.h"
#include "account/detail/indexed_accounts.h"
#include "account/detail/misc_line.h"
#include "account/detail/passwd_line.h"

namespace tavo {
namespace {

Result<NameAndId> ParseAccount(std::string_view text)
{
    Result<PasswdLine> line = ParsePasswdLine(text);
    if (!line)
        return line.Failure();
    return NameAndId{std::move(line->name), line->uid};
}

constexpr AccountLines kAccountLines{ParseAccount, kUserTextRows[kPasswdText].path, kUserKeySize};

Code WriteLines(TAVOBDB *store, const std::vector<IndexedAccount> &accounts, const char *file, DumpReport &report,
                std::string &text)
{
    for (const IndexedAccount &account : accounts) {
        const Result<std::string_view> value = Btree::Of(store)->Get(account.key);
        if (value.Failure() == ERR_KEY_NOT_FOUND) {
            report.missing.push_back({account.name, file});
            continue;
        }
        if (!value)
            return value.Failure();
        if (!IsOneLine(LineOf(*value)))
            return ERR_FORMAT_ERROR;
        text.append(LineOf(*value)) += '\n';
    }
    return 0;
}

Code ComposeFiles(const TAVOUSERDB &db, DumpReport &report, std::string (&texts)[kUserTexts])
{
    AccountKeys keys;
    std::vector<IndexedAccount> accounts;
    if (const Code code = CollectAccounts(*Btree::Of(db.pUid), *Btree::Of(db.pName), kAccountLines, keys, accounts))
        return code;
    report.passwd = ReviewFile(*Btree::Of(db.pName), kAccountLines, keys);
    if (!report.passwd.lost.empty())
        return ERR_WRITE_FAILED;
    int32_t last_uid = TAVO_USER_UID_MIN - 1;
    if (const Code code = ReadLastId(*Btree::Of(db.pUid), kCurrentUidKey, last_uid))
        return code;
    texts[kMiscText] = FormatMarkerLine(kUidMarker, last_uid) + kMiscComment;
    for (const IndexedAccount &account : accounts)
        texts[kPasswdText].append(account.line) += '\n';
    const struct {
        TAVOBDB *store;
        UserTextIndex text;
    } rows[] = {{db.pSmb, kSmbText}, {db.pShadow, kShadowText}, {db.pMisc, kMiscText}};
    for (const auto &row : rows)
        if (const Code code = WriteLines(row.store, accounts, kUserTextRows[row.text].path, report, texts[row.text]))
            return code;
    return 0;
}

}  // namespace

Code ComposeUsers(const TAVOUSERDB &db, AccountCommit &commit, DumpReport &report)
{
    std::string texts[kUserTexts];
    if (const Code code = ComposeFiles(db, report, texts))
        return code;
    TAVOBDB *const stores[] = {db.pName, db.pMisc, db.pShadow, db.pSmb, db.pUid};
    return WriteFamily(kUserFamily, stores, texts, commit, kAccountFile, report.not_opened);
}

}  // namespace tavo
