// Names of users and groups: which are acceptable, and the key that one has in the stores.
#ifndef TAVO_ACCOUNT_DETAIL_ACCOUNT_NAME_H
#define TAVO_ACCOUNT_DETAIL_ACCOUNT_NAME_H

#include <optional>
#include <string>
#include <string_view>

namespace tavo {

inline constexpr int kUserNameChars = 64;
inline constexpr int kGroupNameChars = 15;

// Upper-casing can make a character three times as long, and a name has at most 64 of up to four bytes.
inline constexpr size_t kUserKeySize = 492;
inline constexpr size_t kGroupKeySize = 128;

// The rule that users and groups share; they differ in the greatest number of characters only.
bool IsAccountName(const char *name, int max_chars);

// "." and ".." pass that rule, but cannot be the names of home folders.
bool IsDotName(std::string_view name);

bool IsDomainName(std::string_view name);  // holds a backslash

// The kind of a store's entries: lines by names, or names by ids.
enum class StoreContents { lines, index };

// Returns whether an entry of a store is about a domain account. A description may hold a backslash, too.
bool IsDomainEntry(std::string_view key, std::string_view value, StoreContents contents);

// Keys and values of the stores end in a NUL, so no text in them may have one.
inline bool HasNul(std::string_view text)
{
    return text.find('\0') != text.npos;
}

inline std::string WithNul(std::string_view text)
{
    return std::string(text).append(1, '\0');
}

// The upper-case name with its NUL, as the stores have it. Empty when the name is not UTF-8 or too long for the buffer
// that the appliance's other programs use.
std::optional<std::string> AccountKey(std::string_view name, size_t key_size = kUserKeySize);

}  // namespace tavo

#endif
