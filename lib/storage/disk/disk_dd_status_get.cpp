// Reads how far the wiping of a disk has come.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "storage/detail/device_name.h"

#include <charconv>
#include <string>

namespace {

// "bytes done/bytes total"
bool ParseProgress(std::string_view line, uint64_t &done, uint64_t &total)
{
    line = tavo::WithoutNewline(line);
    const char *const end = line.data() + line.size();
    const auto first = std::from_chars(line.data(), end, done);
    if (first.ec != std::errc{} || first.ptr == end || *first.ptr != '/')
        return false;
    const auto second = std::from_chars(first.ptr + 1, end, total);
    return second.ec == std::errc{} && second.ptr == end;
}

}  // namespace

extern "C" int DiskDDStatusGet(const char *szPath, uint64_t *pcMibDone, uint64_t *pcMibTotal)
{
    if (!szPath || !pcMibDone || !pcMibTotal || !tavo::IsDeviceName(tavo::LastPart(szPath)))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd file =
            tavo::OpenRegular(("/tmp/tavodd." + std::string(tavo::LastPart(szPath))).c_str(), O_RDONLY);
        if (!file)
            return errno == ENOENT ? 0 : -1;
        tavo::LineReader lines(file.Get());
        std::string_view line;
        uint64_t done = 0;
        uint64_t total = 0;
        if (!lines.Next(line) || !ParseProgress(line, done, total))
            return -1;
        *pcMibDone = done >> 20;
        *pcMibTotal = total >> 20;
        return 0;
    });
}
