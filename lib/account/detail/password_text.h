// Passwords in the encodings that the Samba hashes are made of. What is no UTF-8 becomes the replacement character.
#ifndef TAVO_ACCOUNT_DETAIL_PASSWORD_TEXT_H
#define TAVO_ACCOUNT_DETAIL_PASSWORD_TEXT_H

#include "account/detail/password_hash.h"

#include <string>
#include <string_view>

namespace tavo {

std::string UpperCodePage850(std::string_view utf8);  // upper-case, character by character: "ß" stays one
std::string Utf16LowFirst(std::string_view utf8);     // UTF-16, the low byte of each unit first

}  // namespace tavo

#endif
