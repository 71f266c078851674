// Lists the domain accounts that are recorded as in use.
#include "tavo_appliance.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"

#include <string>

namespace {

constexpr char kUsedDomainUsers[] = "/usr/tavo/etc/duser_used";

}  // namespace

extern "C" int TAVOPushDUserUsed(TLIBSZLIST **ppList)
{
    if (!ppList || !*ppList)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd fd = tavo::OpenRegular(kUsedDomainUsers, O_RDONLY);
        if (!fd)
            return errno == ENOENT ? 0 : Fail(ERR_READ_FAILED);
        tavo::LineReader lines(fd.Get());
        int count = 0;
        for (std::string_view line; lines.Next(line);) {
            const std::string name(tavo::WithoutNewline(line));
            if (name.find('\\') == name.npos)
                continue;
            if (TLIBSzListPush(ppList, name.c_str()) < 0)
                return -1;
            ++count;
        }
        return lines.Failed() ? Fail(ERR_READ_FAILED) : count;
    });
}
