// Reads every line into a list.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"

#include <string>

extern "C" int TLIBFileReadLines(const char *szPath, TLIBSZLIST **ppslLines)
{
    if (!szPath || !ppslLines || !*ppslLines)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd fd = tavo::OpenRegular(szPath, O_RDONLY);
        if (!fd)
            return Fail(ERR_OPEN_FAILED);
        tavo::LineReader reader(fd.Get());
        std::string_view line;
        while (reader.Next(line)) {
            const std::string text(tavo::UpToNul(tavo::WithoutNewline(line)));
            if (TLIBSzListPush(ppslLines, text.c_str()) < 0)
                return Fail(ERR_OUT_OF_MEMORY);
        }
        return reader.Failed() ? Fail(ERR_READ_FAILED) : (*ppslLines)->nItem;
    });
}
