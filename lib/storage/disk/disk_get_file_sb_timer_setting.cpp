// Reads the saved spin-down minutes.
#include "tavo_disk.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_search.h"

#include <charconv>

extern "C" int TAVODiskGetFileSBTimerSetting(void)
{
    return Guard([&] {
        // A missing key is no failure: a new appliance has never saved one.
        tavo::FoundLine line;
        if (tavo::FindLineByKey("/etc/tavoinfo.conf", "standbytimer", tavo::Match::first, line) != 0)
            return -1;
        const std::string_view value = tavo::LineValue(line.text);
        int minutes = 0;
        const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), minutes);
        return error == std::errc{} && end == value.data() + value.size() && minutes >= 0 ? minutes : -1;
    });
}
