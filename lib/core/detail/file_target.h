// Finds the file that a path leads to, so that a rewrite replaces that file and keeps the link.
#ifndef TAVO_CORE_DETAIL_FILE_TARGET_H
#define TAVO_CORE_DETAIL_FILE_TARGET_H

#include <string>

namespace tavo {

// Returns the absolute path, without links, of a file that exists or can be created. A link whose target is missing
// leads to that target. Empty when the directory does not exist or the path does not name a file. Also empty for a link
// in a directory that everybody may write to, which may be a trap.
std::string FileTarget(const std::string &path);

// Returns the directory part of an absolute path.
std::string DirectoryOf(const std::string &path);

}  // namespace tavo

#endif
