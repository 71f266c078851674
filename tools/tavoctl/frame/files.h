// Files and folders: read whole, within limits, and written whole.
#ifndef TAVOCTL_FILES_H
#define TAVOCTL_FILES_H

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

inline constexpr std::size_t most_input = 16 << 20;  // bytes of a file that is read whole

// A descriptor with an owner; the standard ones stay open.
class Descriptor {
  public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor();
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;
    bool IsOpen() const { return fd_ >= 0; }
    int Get() const { return fd_; }

  private:
    int fd_;
};

// Throws a Failure for a path to something else than a regular file, or to more than most_input bytes.
void RefuseNoText(const std::string &path);

// A regular file, or standard input for "-", which may be a pipe, too. Throws a Failure for anything else, and for more
// than most_input bytes.
std::string ReadWhole(const std::string &path);

// To standard output for an empty path, or into a new file that only its owner can read.
void WriteWhole(const std::string &path, const std::string &text);

// Replaces a file as a whole; one without text is removed. Throws a Failure.
void ReplaceFile(const std::string &path, const std::string &text);
std::string FileText(const std::string &path);  // "" when it cannot be read

// The first line of a file, usually of the kernel's.
std::optional<std::string> KernelText(const std::string &path);

// Writes a setting of the kernel's; throws a Failure when it does not take it.
void SetKernelText(const std::string &path, const std::string &text, const std::string &attempted);

// The names in a folder, sorted; empty when the folder does not exist. Throws a Failure when it cannot be read to its
// end: a device whose users cannot be listed must not count as free.
std::vector<std::string> FolderNames(const std::string &path);

}  // namespace tavoctl

#endif
