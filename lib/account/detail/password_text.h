// Passwords in the encodings of the Samba hashes. Bytes that are not UTF-8 become the replacement character.
#ifndef TAVO_ACCOUNT_DETAIL_PASSWORD_TEXT_H
#define TAVO_ACCOUNT_DETAIL_PASSWORD_TEXT_H

#include "account/detail/secret_text.h"
#include "core/detail/result.h"

#include <string_view>

namespace tavo {

// Upper-case, character by character: "ß" stays one. A password that cannot be converted is never taken for an empty
// one: 0, or ERR_OP_FAILURE when ICU cannot convert or cannot be loaded. Throws bad_alloc.
Code UpperCodePage850(std::string_view utf8, SecretBytes &bytes);

// UTF-16, the low byte of each unit first. The same codes.
Code Utf16LowFirst(std::string_view utf8, SecretBytes &bytes);

}  // namespace tavo

#endif
