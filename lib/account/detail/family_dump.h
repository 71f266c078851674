// Replaces the text files of an account family by what its open stores say.
#ifndef TAVO_ACCOUNT_DETAIL_FAMILY_DUMP_H
#define TAVO_ACCOUNT_DETAIL_FAMILY_DUMP_H

#include "account/detail/store_family.h"

#include <span>
#include <string>

namespace tavo {

// Stores and texts in the order of the family's tables. The stores take the new files' times as their sync times. 0, a
// code of the stores or of TextCommit; at ERR_OPEN_FAILED `not_opened` is the temporary file's path.
int DumpFamily(const StoreFamily &family, std::span<TAVOBDB *const> stores, std::span<const std::string> texts,
               const char *&not_opened);

}  // namespace tavo

#endif
