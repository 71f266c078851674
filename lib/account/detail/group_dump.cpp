// Writes the two text files of the group family from its open stores.
#include "account/detail/group_dump.h"

#include "account/detail/account_name.h"
#include "account/detail/family_dump.h"
#include "account/detail/group_line.h"
#include "account/detail/indexed_accounts.h"
#include "account/detail/misc_line.h"

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

}  // namespace

int DumpGroups(const TAVOGROUPDB &db, GroupDumpReport &report)
{
    std::string texts[kGroupTexts];
    if (const int code = ComposeFiles(db, report, texts))
        return code;
    TAVOBDB *const stores[] = {db.pName, db.pGid, db.pDesc};
    return DumpFamily(kGroupFamily, stores, texts, report.not_opened);
}

}  // namespace tavo
