// Writes the text files of an account family by what its open stores say.
#ifndef TAVO_ACCOUNT_DETAIL_FAMILY_DUMP_H
#define TAVO_ACCOUNT_DETAIL_FAMILY_DUMP_H

#include "account/detail/account_commit.h"
#include "account/detail/store_family.h"
#include "core/detail/result.h"

#include <span>
#include <string>

namespace tavo {

// Adds the files to a commit. Stores and texts in the order of the family's tables; `target` as AccountCommit::Write takes
// it. 0, a code of the stores or of AccountCommit::Write; at ERR_OPEN_FAILED `not_opened` is the temporary file's path.
Code WriteFamily(const StoreFamily &family, std::span<TAVOBDB *const> stores, std::span<const std::string> texts,
                 AccountCommit &commit, unsigned target, const char *&not_opened);

// The stores take the files' times as their sync times. A time that cannot be recorded costs a rebuild at the next open:
// the files are what counts, and they are in place.
void RecordSyncTimes(const StoreFamily &family, std::span<TAVOBDB *const> stores);

}  // namespace tavo

#endif
