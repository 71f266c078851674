// Appends to a file in place.
#ifndef TAVO_CORE_DETAIL_FILE_APPEND_H
#define TAVO_CORE_DETAIL_FILE_APPEND_H

#include "core/detail/owner.h"

#include <string>

namespace tavo {

// Opens a regular file for reading and appending, with the checks of trusted_file.h; empty with errno on failure.
Fd OpenToAppend(const char *path);

// Appends text in one write and syncs it; `fd` is open for reading and appending. If a crash has left a last line
// without its newline, the newline is added first. On failure the file is cut back to its old length.
bool AppendText(int fd, std::string text);

}  // namespace tavo

#endif
