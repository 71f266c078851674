// Helpers for turning text files into the content of stores.
#include "account/detail/store_content.h"

#include "account/detail/account_name.h"
#include "core/detail/open_file.h"

namespace tavo {

bool ReadTextFile(const char *path, std::string &text, int64_t &mtime)
{
    text.clear();
    mtime = 0;
    const Fd fd = OpenRegular(path, O_RDONLY);
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0)
        return errno == ENOENT;
    mtime = st.st_mtime;
    text.resize(static_cast<size_t>(st.st_size));
    for (size_t length = 0;;) {
        if (length == text.size())
            text.resize(length + 4096);
        const ssize_t more = ::read(fd.Get(), text.data() + length, text.size() - length);
        if (more < 0 && errno == EINTR)
            continue;
        if (more <= 0) {
            text.resize(length);
            return more == 0;
        }
        length += static_cast<size_t>(more);
    }
}

std::string NumberBytes(int32_t number)
{
    return {reinterpret_cast<const char *>(&number), sizeof number};
}

std::optional<std::string> FreeKey(const StoreEntries &taken, std::string_view name, size_t key_size)
{
    std::string as_it_stands(name);
    as_it_stands.push_back('\0');
    std::string key = AccountKey(name, key_size).value_or(as_it_stands);
    if (const auto there = taken.find(key); there != taken.end()) {
        if (there->second.starts_with(std::string(name) + ':') || taken.contains(as_it_stands))
            return std::nullopt;
        key = std::move(as_it_stands);
    }
    return key;
}

}  // namespace tavo
