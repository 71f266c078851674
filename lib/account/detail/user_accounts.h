// Reads, writes and removes one account in the open stores of the user family. Codes come back; nothing is logged.
#ifndef TAVO_ACCOUNT_DETAIL_USER_ACCOUNTS_H
#define TAVO_ACCOUNT_DETAIL_USER_ACCOUNTS_H

#include "tavo_user.h"

#include "account/detail/id_index.h"
#include "account/detail/passwd_line.h"
#include "account/detail/store_view.h"
#include "core/detail/result.h"

#include <string>
#include <string_view>

namespace tavo {

class AccountSession;
struct UserChange;

inline constexpr IdRange kUids{kCurrentUidKey, TAVO_USER_UID_MIN, TAVO_USER_UID_MAX, ERR_TOO_MANY_USERS};
inline constexpr char kHomes[] = "/var/services/homes/";
inline constexpr char kDefaultShell[] = "/bin/csh";

// The stores of a session as the functions here, and callers, know them.
TAVOUSERDB UserDb(const AccountSession &session);

// ERR_KEY_NOT_FOUND, ERR_FORMAT_ERROR, ERR_INVALID_USERNAME, ERR_DB_CURSOR ...
Result<PasswdLine> ReadPasswdLine(const StoreView &names, std::string_view key);
Result<PasswdLine> ReadPasswdLine(const TAVOUSERDB &db, std::string_view key);

// Fills a record from the stores name, shadow and misc. ERR_NO_SUCH_USER; codes of TAVOUserAlloc.
Code ReadUser(const AccountSession &session, std::string_view key, TAVOUSER **user);

// The privilege bits of a record, from the stores name and misc. ERR_NO_SUCH_USER.
Code ReadPrivilege(const AccountSession &session, std::string_view key, int32_t &privilege);

// The key of the account with this user id: ERR_NO_SUCH_USER when there is none.
Result<std::string> FindUserKey(const AccountSession &session, int32_t uid);

// Fails only when a store cannot be changed; then the stores are no longer to be trusted.
Code StoreUser(const TAVOUSERDB &db, const UserChange &change);
Code RemoveUser(const TAVOUSERDB &db, const std::string &key, int32_t uid);

// "root" and "admin" are never deleted or renamed.
bool IsReservedKey(std::string_view key);

}  // namespace tavo

#endif
