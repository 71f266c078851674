// Rewrites files for exported functions and reports failures under their module names.
#include "core/detail/rewrite_report.h"

#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/settings_text.h"

#include <cerrno>

namespace tavo {

void LogUnsyncedDirectory(const FileRewrite &rewrite, Where where)
{
    if (!rewrite.IsDirectorySynced())
        LogErrorAt(where, "%s:%d Failed to sync the directory of %s, errno=%d", rewrite.Target(), errno);
}

int ReplaceOrFail(FileRewrite &rewrite, std::string_view text, Where where)
{
    if (const Code code = rewrite.Replace(text))
        return Fail(code, where);
    LogUnsyncedDirectory(rewrite, where);
    return 0;
}

int ReadOrFail(FileRewrite &rewrite, const char *path, std::string &text, Where where)
{
    if (const Code code = rewrite.Open(path))
        return Fail(code, where);
    return rewrite.Read(text) ? 0
                              : Fail(ERR_WRITE_FAILED, where);  // the one code for everything between open and rename
}

int RewriteText(const char *path, Missing missing, TextEdit edit, Where where) noexcept
{
    const auto rewrite_text = [&] {
        FileRewrite rewrite;
        std::string text;
        const Code code = rewrite.Open(path);
        if (code && !(rewrite.IsMissing() && missing == Missing::create))
            return Fail(code, where);
        if (!code && !rewrite.Read(text))
            return Fail(ERR_WRITE_FAILED, where);
        const std::optional<std::string> changed = edit(std::string_view(text));
        if (!changed)
            return FailNone(ERR_KEY_NOT_FOUND, where);
        return ReplaceOrFail(rewrite, *changed, where) == 0 ? 1 : -1;
    };
    return Guard(rewrite_text, ERR_OUT_OF_MEMORY, where);
}

int RewriteWithLine(const char *path, const char *argument, LineEdit edit, Where where) noexcept
{
    const auto rewrite_text = [&] {
        const std::optional<std::string> whole = OneLine(argument);
        if (!whole)
            return Fail(ERR_BAD_PARAMETERS, where);
        const auto edit_with_line = [&](std::string_view text) {
            return edit(text, *whole);
        };
        return RewriteText(path, Missing::fail, edit_with_line, where);
    };
    return Guard(rewrite_text, ERR_OUT_OF_MEMORY, where);
}

}  // namespace tavo
