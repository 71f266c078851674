// Reads the saved spin-down minutes.
#include "tavo_disk.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_search.h"
#include "core/detail/strict_number.h"

extern "C" int TAVODiskGetFileSBTimerSetting(void)
{
    return Guard([&] {
        // A missing key is not a failure: a new appliance has never saved one.
        tavo::Result<tavo::FoundLine> line = tavo::FindLineByKey(tavo::kSettings, "standbytimer", tavo::Match::first);
        const auto minutes = line ? tavo::StrictNumber<int>(tavo::LineValue(line->text)) : std::nullopt;
        return minutes && *minutes >= 0 ? *minutes : -1;
    });
}
