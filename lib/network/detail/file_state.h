// Files as they were before a change, to be put back when it fails.
#ifndef TAVO_NETWORK_DETAIL_FILE_STATE_H
#define TAVO_NETWORK_DETAIL_FILE_STATE_H

#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace tavo {

struct FileState {
    std::string path;
    std::optional<std::string> text;  // empty: there was no such file
    mode_t mode = 0644;
};

// Empty when there is a file that cannot be read.
std::optional<FileState> ReadFileState(const std::string &path);

// An unchanged file is not touched. 0 or a code.
int PutBack(const FileState &file);

// All interface files and their saved copies.
std::optional<std::vector<FileState>> ReadInterfaceFiles();

}  // namespace tavo

#endif
