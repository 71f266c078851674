// Lines of colon-separated fields, as all account files have them.
#ifndef TAVO_ACCOUNT_DETAIL_COLON_FIELDS_H
#define TAVO_ACCOUNT_DETAIL_COLON_FIELDS_H

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

// All fields, empty ones too; views into `line`, which loses its NULs and line end first.
std::vector<std::string_view> SplitColons(std::string_view line);

// A whole decimal number of 32 bits; a user id above 2^31 reads as the negative number that it is in a record.
std::optional<int32_t> FieldNumber(std::string_view field);

// Bytes that a field of an account line may not hold: control bytes, which end lines, and, when `colon` is set, the
// colon.
bool FitsInField(std::string_view text, bool colon_ends_it);

// Colons in free text, encoded for a line and back.
std::string EncodeColons(const char *text);
std::string DecodeColons(std::string_view text);

}  // namespace tavo

#endif
