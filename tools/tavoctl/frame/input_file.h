// Files that callers name: read whole, within limits.
#ifndef TAVOCTL_INPUT_FILE_H
#define TAVOCTL_INPUT_FILE_H

#include <cstddef>
#include <string>

namespace tavoctl {

inline constexpr std::size_t most_input = 16 << 20;  // bytes of a file that is read whole

// A regular file, or standard input for "-", which may be a pipe, too. Throws a Failure for anything else, and for more
// than most_input bytes.
std::string ReadWhole(const std::string &path);

// To standard output for an empty path, or into a new file that only its owner can read.
void WriteWhole(const std::string &path, const std::string &text);

// Replaces a file as a whole; one without text is removed. Throws a Failure.
void ReplaceFile(const std::string &path, const std::string &text);
std::string FileText(const std::string &path);  // "" when it cannot be read

}  // namespace tavoctl

#endif
