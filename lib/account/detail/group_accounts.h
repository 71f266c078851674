// Reads, writes and removes one group in the open stores of the group family. Codes come back; nothing is logged.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_ACCOUNTS_H
#define TAVO_ACCOUNT_DETAIL_GROUP_ACCOUNTS_H

#include "tavo_group.h"

#include "account/detail/group_line.h"
#include "account/detail/id_index.h"
#include "core/detail/result.h"

namespace tavo {

class AccountSession;

inline constexpr IdRange kGids{kCurrentGidKey, TAVO_GROUP_GID_MIN, TAVO_GROUP_GID_MAX, ERR_TOO_MANY_GROUPS};

// The stores of a session as the functions here, and callers, know them.
TAVOGROUPDB GroupDb(const AccountSession &session);

// ERR_NO_SUCH_GROUP; ERR_FORMAT_ERROR, ERR_INVALID_GROUPNAME, ERR_DB_CURSOR ...
Result<GroupLine> ReadGroupLine(const StoreView &names, std::string_view key);
Result<GroupLine> ReadGroupLine(const TAVOGROUPDB &db, std::string_view key);

// The key of the group with this id: ERR_NO_SUCH_GROUP when there is none.
Result<std::string> FindGroupKey(const AccountSession &session, int32_t gid);

// A description that fits into its line. "" takes the description away.
bool IsGroupDescription(std::string_view text);

// The complete new entries of one group, already checked: storing them cannot be refused.
struct GroupChange {
    std::string old_key;   // of the group that is replaced; empty when one is added
    std::string old_name;  // as it was
    int32_t old_gid = -1;
    std::string key;
    GroupLine line;
};

// Refuses with one of the codes of TAVOGroupDBSet; changes nothing. `gid` -1 keeps that of the old group.
Code PrepareGroup(const TAVOGROUPDB &db, const char *old_name, const TAVOGROUP &group, int32_t gid,
                  GroupChange &change);

// Fails only when a store cannot be changed; then the stores are no longer to be trusted.
Code StoreGroup(const TAVOGROUPDB &db, const GroupChange &change);

// ERR_GROUP_DB_DELETE or ERR_OUT_OF_MEMORY when a store cannot be changed. Missing entries are skipped.
Code RemoveGroup(const TAVOGROUPDB &db, const std::string &key, int32_t gid);

}  // namespace tavo

#endif
