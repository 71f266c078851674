// Removes a leading UTF-8 byte-order mark.
#include "tavo_file.h"

#include "core/detail/rewrite_report.h"

extern "C" int TLIBFileUTF8BomStrip(const char *szPath)
{
    if (!szPath)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FileRewrite rewrite;
        std::string text;
        if (const int code = rewrite.Open(szPath))
            return Fail(code);
        if (!rewrite.Read(text))
            return Fail(ERR_WRITE_FAILED);
        constexpr std::string_view mark = "\xEF\xBB\xBF";
        if (!text.starts_with(mark))
            return 0;
        return tavo::ReplaceOrFail(rewrite, std::string_view(text).substr(mark.size())) == 0 ? 1 : -1;
    });
}
