// Turns clear-text passwords into the hashes of the shadow file.
#ifndef TAVO_ACCOUNT_DETAIL_PASSWORD_HASH_H
#define TAVO_ACCOUNT_DETAIL_PASSWORD_HASH_H

#include <ctime>
#include <string>
#include <string_view>

namespace tavo {

// The setting that crypt gets: without a previous hash (empty) two salt characters from the clock; else the salt of the
// previous one, also of one that is not an MD5 hash. A previous hash that would leave the salt empty (an empty or
// locked password, "$6$...") counts as none: all users would share one hash for one password.
std::string HashSetting(std::string_view previous, time_t now);

// The methods that "password_hash" in /etc.defaults/tavoinfo.conf names. MD5-crypt is what the appliance's other
// programs expect, and what an absent or unknown value means. kUnknown: the setting cannot be read.
enum class HashMethod { md5, sha512, yescrypt, unknown };

HashMethod ConfiguredHashMethod();

// A hash of a new password. MD5-crypt takes its setting from HashSetting, the other methods a random salt of full
// length from the system. Empty when the system cannot make one (a password longer than crypt takes, say). Throws
// bad_alloc.
std::string HashPassword(const char *clear, std::string_view previous, time_t now, HashMethod method = HashMethod::md5);

}  // namespace tavo

#endif
