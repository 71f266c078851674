// Appends a section in place.
#include "tavo_section.h"

#include "core/detail/file_append.h"
#include "core/detail/guard.h"
#include "core/detail/rewrite_report.h"
#include "core/detail/section_text.h"

extern "C" int ErrTLIBFileAddSection(const char *szPath, const char *szSection, const TLIBSZHASH *pshPairs,
                                     const char *szFormat)
{
    if (!szPath || !szSection || !pshPairs)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> text = tavo::SectionText(szSection, pshPairs, szFormat);
        if (!text)
            return Fail(tavoerrno);
        const tavo::Fd fd = tavo::OpenToAppend(szPath);
        if (fd)
            return tavo::AppendText(fd.Get(), *text) ? 0 : Fail(ERR_WRITE_FAILED);
        tavo::FileRewrite rewrite;
        if (rewrite.Open(szPath) == 0 || !rewrite.IsMissing())
            return Fail(ERR_OPEN_FAILED);
        return tavo::ReplaceOrFail(rewrite, *text);
    });
}
