// Writes the two text files of the group family from its open stores.
#include "account/detail/group_dump.h"

#include "account/detail/account_name.h"
#include "account/detail/group_line.h"
#include "account/detail/indexed_accounts.h"
#include "account/detail/misc_line.h"
#include "account/detail/text_commit.h"

#include <sys/stat.h>

namespace tavo {
namespace {

int ParseGroup(std::string_view text, std::string &name, int32_t &id)
{
    GroupLine line;
    const int code = ParseGroupLine(text, line);
    if (code == 0) {
        name = std::move(line.name);
        id = line.gid;
    }
    return code;
}

constexpr AccountLines kGroupLines{ParseGroup, kGroupTextRows[kGroupText].path, kGroupKeySize};

int ComposeFiles(const TAVOGROUPDB &db, GroupDumpReport &report, std::string (&texts)[kGroupTexts])
{
    AccountKeys keys;
    std::vector<IndexedAccount> groups;
    if (const int code = CollectAccounts(*Btree::Of(db.pGid), *Btree::Of(db.pName), kGroupLines, keys, groups))
        return code;
    report.lost = AccountThatWouldBeLost(*Btree::Of(db.pName), kGroupLines, keys);
    if (!report.lost.empty())
        return ERR_WRITE_FAILED;
    int32_t current = TAVO_GROUP_GID_MIN - 1;
    Btree::Of(db.pGid)->GetNumber(kCurrentGidKey, current);
    texts[kGroupText] = FormatMarkerLine(kGidMarker, current);
    for (const IndexedAccount &group : groups) {
        texts[kGroupText].append(group.line) += '\n';
        std::string_view description;
        const int code = Btree::Of(db.pDesc)->Get(group.key, description);
        if (code == ERR_KEY_NOT_FOUND)
            continue;
        if (code != 0)
            return code;
        if (!IsOneLine(LineOf(description)))
            return ERR_FORMAT_ERROR;
        texts[kDescText].append(LineOf(description)) += '\n';
    }
    return 0;
}

// A time that cannot be recorded costs a rebuild at the next open: the files are what counts, and they are in place.
void RecordSyncTimes(const TAVOGROUPDB &db)
{
    TAVOBDB *const stores[] = {db.pName, db.pGid, db.pDesc};
    for (size_t i = 0; i < kGroupStores; ++i) {
        struct stat st = {};
        ::lstat(kGroupStoreRows[i].text, &st);
        Btree::Of(stores[i])->SetNumber(kSyncTimeKey, static_cast<int32_t>(st.st_mtime));
    }
}

}  // namespace

int DumpGroups(const TAVOGROUPDB &db, GroupDumpReport &report)
{
    std::string texts[kGroupTexts];
    if (const int code = ComposeFiles(db, report, texts))
        return code;
    // A full /tmp must show before anything is decided.
    for (TAVOBDB *store : {db.pName, db.pGid, db.pDesc})
        if (const int code = Btree::Of(store)->Flush())
            return code;
    TextCommit commit(kGroupFamily);
    for (size_t i = 0; i < kGroupTexts; ++i) {
        const int code = commit.Write(i, texts[i]);
        if (code == ERR_OPEN_FAILED)
            report.not_opened = kGroupTextRows[i].temporary;
        if (code != 0)
            return code;
    }
    if (const int code = commit.Commit())
        return code;
    RecordSyncTimes(db);
    return 0;
}

}  // namespace tavo
