// Replaces a text in every line.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/rewrite_report.h"

#include <climits>

namespace {

std::string Replaced(std::string_view text, std::string_view old_piece, std::string_view new_piece, int &count)
{
    std::string changed;
    for (size_t at; count < INT_MAX && (at = text.find(old_piece)) != text.npos; ++count) {
        changed += text.substr(0, at);
        changed += new_piece;
        text.remove_prefix(at + old_piece.size());
    }
    return changed += text;
}

}  // namespace

extern "C" int TLIBFileReplaceSubStr(const char *szPath, const char *szOld, const char *szNew)
{
    if (!szPath || !szOld || !*szOld || !szNew)
        return Fail(ERR_BAD_PARAMETERS);
    const std::string_view old_piece = szOld, new_piece = szNew;
    if (old_piece.find('\n') != old_piece.npos || new_piece.find('\n') != new_piece.npos)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FileRewrite rewrite;
        std::string text;
        if (tavo::ReadOrFail(rewrite, szPath, text) != 0)
            return -1;
        int count = 0;
        const std::string changed = Replaced(text, old_piece, new_piece, count);
        return count == 0 || tavo::ReplaceOrFail(rewrite, changed) == 0 ? count : -1;
    });
}
