// Writes the two text files of the group family from its open stores.
#include "account/detail/group_dump.h"

#include "account/detail/account_name.h"
#include "account/detail/account_transaction.h"
#include "account/detail/family_dump.h"
#include "account/detail/group_accounts.h"
#include "account/detail/group_line.h"
#include "account/detail/id_index.h"
#include "account/detail/indexed_accounts.h"
#include "account/detail/misc_line.h"
#include "core/detail/log.h"

namespace tavo {
namespace {

Result<NameAndId> ParseGroup(std::string_view text)
{
    Result<GroupLine> line = ParseGroupLine(text);
    if (!line)
        return line.Failure();
    return NameAndId{std::move(line->name), line->gid};
}

constexpr AccountLines kGroupLines{ParseGroup, kGroupTextRows[kGroupText].path, kGroupKeySize};

Code ComposeFiles(const TAVOGROUPDB &db, GroupDumpReport &report, std::string (&texts)[kGroupTexts])
{
    AccountKeys keys;
    std::vector<IndexedAccount> groups;
    if (const Code code = CollectAccounts(*Btree::Of(db.pGid), *Btree::Of(db.pName), kGroupLines, keys, groups))
        return code;
    report.groups = ReviewFile(*Btree::Of(db.pName), kGroupLines, keys);
    if (!report.groups.lost.empty())
        return ERR_WRITE_FAILED;
    int32_t last_gid = TAVO_GROUP_GID_MIN - 1;
    if (const Code code = ReadLastId(*Btree::Of(db.pGid), kCurrentGidKey, last_gid))
        return code;
    texts[kGroupText] = FormatMarkerLine(kGidMarker, last_gid);
    for (const IndexedAccount &group : groups) {
        texts[kGroupText].append(group.line) += '\n';
        const Result<std::string_view> description = Btree::Of(db.pDesc)->Get(group.key);
        if (description.Failure() == ERR_KEY_NOT_FOUND)
            continue;
        if (!description)
            return description.Failure();
        if (!IsOneLine(LineOf(*description)))
            return ERR_FORMAT_ERROR;
        texts[kDescText].append(LineOf(*description)) += '\n';
    }
    return 0;
}

}  // namespace

Code ComposeGroups(const TAVOGROUPDB &db, AccountCommit &commit, unsigned target, GroupDumpReport &report)
{
    std::string texts[kGroupTexts];
    if (const Code code = ComposeFiles(db, report, texts))
        return code;
    TAVOBDB *const stores[] = {db.pName, db.pGid, db.pDesc};
    return WriteFamily(kGroupFamily, stores, texts, commit, target, report.not_opened);
}

void LogDroppedGroups(const GroupDumpReport &report, Where where)
{
    for (const std::string &line : report.groups.dropped)
        LogErrorAt(where, "%s:%d Line [%s] of %s is not a group and is not written again", line, kGroupLines.path);
}

int CommitGroups(AccountTransaction &change, Where where)
{
    GroupDumpReport report;
    change.Compose();
    Code code = change.ComposeAccounts([&] {
        report = {};
        return ComposeGroups(GroupDb(change.Session()), change.Files(), kAccountFile, report);
    });
    if (code == 0)
        code = change.Commit();
    if (code == 0) {
        LogDroppedGroups(report, where);
        return 0;
    }
    if (report.not_opened)
        LogErrorAt(where, "%s:%d fail to open file[%s]", report.not_opened);
    else if (!report.groups.lost.empty())
        LogErrorAt(where, "%s:%d Group [%s] would be lost, the files are left alone", report.groups.lost);
    else
        LogErrorAt(where, "%s:%d Failed to write the group files, tavoerr=0x%04X, errno=%d", code, errno);
    return code;
}

}  // namespace tavo
