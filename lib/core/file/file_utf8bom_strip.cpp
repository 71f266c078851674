// Removes a leading UTF-8 byte-order mark.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/rewrite_report.h"

extern "C" int TLIBFileUTF8BomStrip(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FileRewrite rewrite;
        std::string text;
        if (tavo::ReadOrFail(rewrite, szPath, text) != 0)
            return -1;
        constexpr std::string_view mark = "\xEF\xBB\xBF";
        if (!text.starts_with(mark))
            return 0;
        return tavo::ReplaceOrFail(rewrite, std::string_view(text).substr(mark.size())) == 0 ? 1 : -1;
    });
}
