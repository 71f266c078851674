// How an exported function rewrites a file and reports what went wrong, under its own module name.
#ifndef TAVO_CORE_DETAIL_REWRITE_REPORT_H
#define TAVO_CORE_DETAIL_REWRITE_REPORT_H

#include "core/detail/fault.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/guard.h"
#include "core/detail/log.h"
#include "core/detail/settings_text.h"

#include <optional>

namespace tavo {
namespace {

// The file is the new one already, so that its directory could not be synced fails nothing.
[[maybe_unused]] void LogUnsyncedDirectory(const FileRewrite &rewrite, Line line = Line{__builtin_LINE()})
{
    if (!rewrite.IsDirectorySynced())
        LogError({"%s:%d Failed to sync the directory of %s, errno=%d", line.number}, rewrite.Target(), errno);
}

// 0, or -1 with the code set.
[[maybe_unused]] int ReplaceOrFail(FileRewrite &rewrite, std::string_view text, Line line = Line{__builtin_LINE()})
{
    if (const int code = rewrite.Replace(text))
        return Fail(code, line);
    LogUnsyncedDirectory(rewrite, line);
    return 0;
}

// Opens a file that is to be rewritten and reads it. 0, or -1 with the code set.
[[maybe_unused]] int ReadOrFail(FileRewrite &rewrite, const char *path, std::string &text,
                                Line line = Line{__builtin_LINE()})
{
    if (const int code = rewrite.Open(path))
        return Fail(code, line);
    return rewrite.Read(text) ? 0 : Fail(ERR_WRITE_FAILED, line);  // the one code of everything between open and rename
}

enum class Missing { fail, create };

// Rewrites a file by an edit of its whole text. The edit takes the old text and gives the new one, or nothing when the
// line or key that it is about is not there. 1, 0 with ERR_KEY_NOT_FOUND, -1 with another code.
template <class Edit>
int RewriteText(const char *path, Missing missing, Edit &&edit, Line line = Line{__builtin_LINE()})
{
    const auto rewrite_text = [&] {
        FileRewrite rewrite;
        std::string text;
        const int code = rewrite.Open(path);
        if (code && !(rewrite.IsMissing() && missing == Missing::create))
            return Fail(code, line);
        if (!code && !rewrite.Read(text))
            return Fail(ERR_WRITE_FAILED, line);
        const std::optional<std::string> changed = edit(std::string_view(text));
        if (!changed)
            return static_cast<int>(FailZero(ERR_KEY_NOT_FOUND, line));
        return ReplaceOrFail(rewrite, *changed, line) == 0 ? 1 : -1;
    };
    return Guard(rewrite_text, ERR_OUT_OF_MEMORY, line);
}

// The same by a line that the caller gives, without its newline or with it.
template <class Edit>
int RewriteWithLine(const char *path, const char *argument, Edit &&edit, Line line = Line{__builtin_LINE()})
{
    const auto rewrite_text = [&] {
        const std::optional<std::string> whole = OneLine(argument);
        if (!whole)
            return Fail(ERR_BAD_PARAMETERS, line);
        return RewriteText(
            path, Missing::fail, [&](std::string_view text) { return edit(text, *whole); }, line);
    };
    return Guard(rewrite_text, ERR_OUT_OF_MEMORY, line);
}

}  // namespace
}  // namespace tavo

#endif
