// The content of a family's stores, before it is in files: the result of reading the text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_CONTENT_H
#define TAVO_ACCOUNT_DETAIL_STORE_CONTENT_H

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

using StoreEntries = std::map<std::string, std::string, std::less<>>;  // by key, both with their NUL

struct StoreContent {
    std::vector<StoreEntries> stores;  // in the order of the family's table
    std::vector<int64_t> sync_times;   // of the text file of each
};

// A whole text file and its modification time. A file that does not exist is empty, with the time 0. False when it
// exists and cannot be read, or is not a regular file.
bool ReadTextFile(const char *path, std::string &text, int64_t &mtime);

// The bytes of a 32-bit value of a reserved key.
std::string NumberBytes(int32_t number);

// The key of an account in the text files. Two names that differ only in case would share a key, and one account would
// be lost. So the second one is stored under its unchanged name, where look-ups do not find it but every rewrite of the
// files does. Empty for a name that exists already.
std::optional<std::string> FreeKey(const StoreEntries &taken, std::string_view name, size_t key_size);

}  // namespace tavo

#endif
