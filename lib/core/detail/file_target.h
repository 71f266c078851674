// Where a path leads: the file that a rewrite replaces, so that a link to it stays a link.
#ifndef TAVO_CORE_DETAIL_FILE_TARGET_H
#define TAVO_CORE_DETAIL_FILE_TARGET_H

#include <string>

namespace tavo {

// The absolute path without links of a file that exists or can be created; a link whose target is missing leads to that
// target. Empty when its directory does not exist, when the path names no file, and, as a trap, for a link in a
// directory that everybody may write to.
std::string FileTarget(const std::string &path);

// The directory part of an absolute path.
std::string DirectoryOf(const std::string &path);

}  // namespace tavo

#endif
