// One-line files of the kernel in /sys.
#include "storage/detail/kernel_text.h"

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/strict_number.h"

namespace tavo {

std::optional<std::string> KernelText(const std::string &path)
{
    const Fd file = OpenFd(path.c_str(), O_RDONLY);
    LineReader lines(file.Get());
    std::string_view line;
    if (!file || !lines.Next(line))
        return std::nullopt;
    return std::string(WithoutNewline(line));
}

std::optional<uint64_t> KernelNumber(const std::string &path)
{
    const std::optional<std::string> text = KernelText(path);
    return text ? StrictNumber<uint64_t>(*text) : std::nullopt;
}

}  // namespace tavo
