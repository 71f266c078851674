// /proc/mounts.
#include "core/detail/mount_table.h"

#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/text_fields.h"

namespace tavo {
namespace {

bool IsOctal(char byte)
{
    return byte >= '0' && byte <= '7';
}

std::string Decoded(std::string_view field)
{
    std::string text;
    for (size_t i = 0; i < field.size(); ++i) {
        if (field[i] == '\\' && i + 3 < field.size() && IsOctal(field[i + 1]) && IsOctal(field[i + 2]) &&
            IsOctal(field[i + 3])) {
            text += static_cast<char>((field[i + 1] - '0') * 64 + (field[i + 2] - '0') * 8 + (field[i + 3] - '0'));
            i += 3;
        } else {
            text += field[i];
        }
    }
    return text;
}

}  // namespace

bool Mount::Has(std::string_view option) const
{
    for (std::string_view rest = options; !rest.empty();) {
        const std::string_view one = TakeUntil(rest, ',');
        if (one.substr(0, one.find('=')) == option)
            return true;
    }
    return false;
}

std::vector<Mount> ParseMounts(std::string_view text)
{
    std::vector<Mount> mounts;
    while (!text.empty()) {
        const std::vector<std::string_view> fields = SplitFields(TakeLine(text));
        if (fields.size() >= 4)
            mounts.push_back({Decoded(fields[0]), Decoded(fields[1]), std::string(fields[2]), std::string(fields[3])});
    }
    return mounts;
}

bool ReadMounts(std::vector<Mount> &mounts)
{
    const Fd file = OpenFd("/proc/mounts", O_RDONLY);
    if (!file)
        return false;
    LineReader lines(file.Get());
    std::string text;
    for (std::string_view line; lines.Next(line);)
        text += line;
    mounts = ParseMounts(text);
    return !lines.Failed();
}

}  // namespace tavo
