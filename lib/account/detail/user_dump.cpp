// Writes the four text files of the user family from its open stores.
#include "account/detail/user_dump.h"

#include "account/detail/account_name.h"
#include "account/detail/btree.h"
#include "account/detail/misc_line.h"
#include "account/detail/passwd_line.h"
#include "account/detail/store_content.h"
#include "account/detail/text_commit.h"
#include "core/detail/text_fields.h"

#include <algorithm>
#include <set>

#include <sys/stat.h>

namespace tavo {
namespace {

using Keys = std::set<std::string, std::less<>>;

struct Account {
    std::string key;
    std::string name;
    uint32_t uid;
    std::string line;
};

std::string_view LineOf(std::string_view value)
{
    return value.substr(0, value.find('\0'));
}

// A line end inside a line would make an account of its own of what follows it.
bool IsOneLine(std::string_view line)
{
    return line.find('\n') == line.npos;
}

int AddAccount(std::string_view key, std::string_view value, Keys &seen, std::vector<Account> &accounts)
{
    PasswdLine line;
    const std::string_view text = LineOf(value);
    if (!IsOneLine(text) || ParsePasswdLine(text, line) != 0)
        return ERR_FORMAT_ERROR;
    if (seen.emplace(key).second && !IsDomainName(line.name))
        accounts.push_back({std::string(key), line.name, static_cast<uint32_t>(line.uid), std::string(text)});
    return 0;
}

// Every account, by the index and then those that it does not name: accounts that share an id with another one.
int CollectAccounts(const TAVOUSERDB &db, Keys &seen, std::vector<Account> &accounts)
{
    Btree &index = *Btree::Of(db.pUid);
    Btree &names = *Btree::Of(db.pName);
    std::string_view key;
    std::string_view value;
    int code;
    for (index.nCursorType = TAVO_BDB_CURSOR_FIRST; (code = index.Step(true, key, value)) == 0;
         index.nCursorType = TAVO_BDB_CURSOR_NEXT) {
        std::string_view line;
        if (names.Get(value, line) == 0 && (code = AddAccount(value, line, seen, accounts)) != 0)
            return code;
    }
    if (code != ERR_DB_END)
        return code;
    for (names.nCursorType = TAVO_BDB_CURSOR_FIRST; (code = names.Step(true, key, value)) == 0;
         names.nCursorType = TAVO_BDB_CURSOR_NEXT)
        if ((code = AddAccount(key, value, seen, accounts)) != 0)
            return code;
    std::stable_sort(accounts.begin(), accounts.end(),
                     [](const Account &left, const Account &right) { return left.uid < right.uid; });
    return code == ERR_DB_END ? 0 : code;
}

// The files are written whole, so an account that the stores do not know would be gone without anybody having deleted
// it. Empty when there is none.
std::string AccountThatWouldBeLost(const Btree &names, const Keys &kept)
{
    std::string text;
    int64_t ignored = 0;
    if (!ReadTextFile(kUserTextRows[kPasswdText].path, text, ignored))
        return "?";
    for (std::string_view rest = text; !rest.empty();) {
        PasswdLine line;
        const std::string_view whole = TakeLine(rest);
        if (whole.find('\0') != whole.npos || ParsePasswdLine(whole, line) != 0 || IsDomainName(line.name))
            continue;
        const std::string as_it_stands = line.name + '\0';
        const std::string key = AccountKey(line.name).value_or(as_it_stands);
        if (!kept.contains(key) && !kept.contains(as_it_stands) && !names.Deleted().contains(key))
            return line.name;
    }
    return {};
}

int WriteLines(TAVOBDB *store, const std::vector<Account> &accounts, const char *file, DumpReport &report,
               std::string &text)
{
    for (const Account &account : accounts) {
        std::string_view value;
        const int code = Btree::Of(store)->Get(account.key, value);
        if (code == ERR_KEY_NOT_FOUND) {
            report.missing.push_back({account.name, file});
            continue;
        }
        if (code != 0)
            return code;
        if (!IsOneLine(LineOf(value)))
            return ERR_FORMAT_ERROR;
        text.append(LineOf(value)) += '\n';
    }
    return 0;
}

int32_t CurrentUid(const TAVOUSERDB &db)
{
    int32_t uid = TAVO_USER_UID_MIN - 1;
    Btree::Of(db.pUid)->GetNumber(kCurrentUidKey, uid);
    return uid;
}

int ComposeFiles(const TAVOUSERDB &db, DumpReport &report, std::string (&texts)[kUserTexts])
{
    Keys keys;
    std::vector<Account> accounts;
    if (const int code = CollectAccounts(db, keys, accounts))
        return code;
    report.lost = AccountThatWouldBeLost(*Btree::Of(db.pName), keys);
    if (!report.lost.empty())
        return ERR_WRITE_FAILED;
    texts[kMiscText] = FormatMarkerLine(kUidMarker, CurrentUid(db)) + kMiscComment;
    for (const Account &account : accounts)
        texts[kPasswdText].append(account.line) += '\n';
    const struct {
        TAVOBDB *store;
        UserTextIndex text;
    } rows[] = {{db.pSmb, kSmbText}, {db.pShadow, kShadowText}, {db.pMisc, kMiscText}};
    for (const auto &row : rows)
        if (const int code = WriteLines(row.store, accounts, kUserTextRows[row.text].path, report, texts[row.text]))
            return code;
    return 0;
}

// A time that cannot be recorded costs a rebuild at the next open: the files are what counts, and they are in place.
void RecordSyncTimes(const TAVOUSERDB &db)
{
    TAVOBDB *const stores[] = {db.pName, db.pMisc, db.pShadow, db.pSmb, db.pUid};
    for (size_t i = 0; i < kUserStores; ++i) {
        struct stat st = {};
        ::lstat(kUserStoreRows[i].text, &st);
        Btree::Of(stores[i])->SetNumber(kSyncTimeKey, static_cast<int32_t>(st.st_mtime));
    }
}

}  // namespace

int DumpUsers(const TAVOUSERDB &db, DumpReport &report)
{
    std::string texts[kUserTexts];
    if (const int code = ComposeFiles(db, report, texts))
        return code;
    // A full /tmp must show before anything is decided.
    for (TAVOBDB *store : {db.pName, db.pMisc, db.pShadow, db.pSmb, db.pUid})
        if (const int code = Btree::Of(store)->Flush())
            return code;
    TextCommit commit(kUserFamily);
    for (size_t i = 0; i < kUserTexts; ++i) {
        const int code = commit.Write(i, texts[i]);
        if (code == ERR_OPEN_FAILED)
            report.not_opened = kUserTextRows[i].temporary;
        if (code != 0)
            return code;
    }
    if (const int code = commit.Commit())
        return code;
    RecordSyncTimes(db);
    return 0;
}

}  // namespace tavo
