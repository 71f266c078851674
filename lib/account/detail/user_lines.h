// Changes of the shadow and the Samba line of one user, beside those of whole accounts.
#ifndef TAVO_ACCOUNT_DETAIL_USER_LINES_H
#define TAVO_ACCOUNT_DETAIL_USER_LINES_H

#include "core/detail/fault.h"
#include "core/detail/result.h"

#include <functional>
#include <string>

namespace tavo {

struct UserLines {
    std::string shadow;
    std::string samba;  // empty when the account has none
};

// Reads the lines of an account, has them edited, and commits the differences, as one change with its locks and
// consequences. A code of the edit, of AccountTransaction::Begin, ERR_INVALID_USERNAME, ERR_NO_SUCH_USER (also for
// accounts of a domain and without a shadow line) leaves everything unchanged. Reports at `where`: 0 or -1.
int ChangeUserLines(const char *name, const std::function<Code(UserLines &)> &edit, Where where = Where());

}  // namespace tavo

#endif
