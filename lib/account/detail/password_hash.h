// Turns clear-text passwords into the hashes of the shadow file.
#ifndef TAVO_ACCOUNT_DETAIL_PASSWORD_HASH_H
#define TAVO_ACCOUNT_DETAIL_PASSWORD_HASH_H

#include <ctime>
#include <string>
#include <string_view>

namespace tavo {

// The setting that crypt gets: without a previous hash (empty) two salt characters from the clock; else the salt of the
// previous one, also of one that is no MD5 hash. A previous hash that would leave the salt empty (an empty or locked
// password, "$6$...") counts as none: all users would share one hash for one password.
std::string HashSetting(std::string_view previous, time_t now);

// An MD5-crypt hash; empty when the system cannot make one (a password longer than crypt takes, say).
std::string HashPassword(const std::string &clear, std::string_view previous, time_t now);

// Overwrites a text that was a secret and empties it.
void Forget(std::string &secret) noexcept;

}  // namespace tavo

#endif
