// Checks account names and makes their keys.
#include "account/detail/account_name.h"

#include "tavo_str.h"

#include "core/detail/keep_fault.h"

#include <algorithm>
#include <new>

namespace tavo {
namespace {

bool IsNameByte(char byte)
{
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') || (byte >= '0' && byte <= '9') ||
           byte == '.' || byte == '-' || byte == '_' || byte == ' ' || static_cast<unsigned char>(byte) >= 0x80;
}

bool IsAscii(std::string_view text)
{
    return std::all_of(text.begin(), text.end(), [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
}

}  // namespace

bool IsAccountName(const char *name, int max_chars)
{
    if (!name || !*name)
        return false;
    const std::string_view text = name;
    if (text.front() == '-' || text.front() == ' ' || text.back() == ' ' ||
        !std::all_of(text.begin(), text.end(), IsNameByte))
        return false;
    if (IsAscii(text))
        return text.size() <= static_cast<size_t>(max_chars);
    const KeepFault keep;
    const int chars = TLIBUnicodeUTF8StrCountChar(name);
    return chars >= 0 && chars <= max_chars;
}

bool IsDotName(std::string_view name)
{
    return name == "." || name == "..";
}

bool IsDomainName(std::string_view name)
{
    return name.find('\\') != std::string_view::npos;
}

bool IsDomainEntry(std::string_view key, std::string_view value, StoreContents contents)
{
    return IsDomainName(contents == StoreContents::index ? value : key);
}

std::optional<std::string> AccountKey(std::string_view name, size_t key_size)
{
    std::string key(name);
    if (IsAscii(name)) {
        std::transform(key.begin(), key.end(), key.begin(), [](char byte) {
            return byte >= 'a' && byte <= 'z' ? static_cast<char>(byte - 'a' + 'A') : byte;
        });
        key.push_back('\0');
        return key.size() <= key_size ? std::optional(std::move(key)) : std::nullopt;
    }
    const KeepFault keep;
    std::string upper(key_size, '\0');
    tavoerrno = 0;
    const int length = TLIBUnicodeUTF8StrUpper(key.c_str(), upper.data(), static_cast<int>(upper.size()));
    if (length <= 0 && tavoerrno == ERR_OUT_OF_MEMORY)
        throw std::bad_alloc();  // without a key the account's store entry could never be found
    if (length <= 0)
        return std::nullopt;
    upper.resize(static_cast<size_t>(length));
    return upper;
}

}  // namespace tavo
