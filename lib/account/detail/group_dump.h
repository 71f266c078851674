// Writes the two text files of the group family from its open stores.
#ifndef TAVO_ACCOUNT_DETAIL_GROUP_DUMP_H
#define TAVO_ACCOUNT_DETAIL_GROUP_DUMP_H

#include "tavo_group.h"

#include <string>

namespace tavo {

// What a rewrite that failed has to tell: the caller logs it.
struct GroupDumpReport {
    const char *not_opened = nullptr;  // the temporary file of ERR_OPEN_FAILED
    std::string lost;                  // the group that would have been lost
};

// 0, ERR_OPEN_FAILED, ERR_WRITE_FAILED, ERR_NOT_ENOUGH_SPACE, ERR_RENAME_FAILED, ERR_FORMAT_ERROR (a store holds a line
// that is no group), or a code of the stores.
int DumpGroups(const TAVOGROUPDB &db, GroupDumpReport &report);

}  // namespace tavo

#endif
