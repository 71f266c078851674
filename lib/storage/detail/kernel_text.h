// One-line files of the kernel in /sys.
#ifndef TAVO_STORAGE_DETAIL_KERNEL_TEXT_H
#define TAVO_STORAGE_DETAIL_KERNEL_TEXT_H

#include <cstdint>
#include <optional>
#include <string>

namespace tavo {

// The first line without its newline; empty when the file cannot be read. Throws bad_alloc.
std::optional<std::string> KernelText(const std::string &path);

// The same as a decimal number.
std::optional<uint64_t> KernelNumber(const std::string &path);

}  // namespace tavo

#endif
