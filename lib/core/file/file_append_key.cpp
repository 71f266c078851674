// Appends a key in place, unless the file sets it already.
#include "tavo_file.h"

#include "core/detail/file_append.h"
#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_format.h"
#include "core/detail/line_reader.h"
#include "core/detail/rewrite_report.h"

namespace {

// The file with this one line. It is created by a rewrite, too, so that no reader ever sees it empty.
int CreateWith(const char *path, const std::string &line)
{
    tavo::FileRewrite rewrite;
    if (rewrite.Open(path) == 0 || !rewrite.IsMissing())  // another process has created it since
        return Fail(ERR_OPEN_FAILED);
    const tavo::Code code = rewrite.Replace(line);
    if (code == ERR_WRITE_FAILED)
        return Fail(code, Line{66});
    if (code)
        return Fail(code);
    tavo::LogUnsyncedDirectory(rewrite);
    return 1;
}

int AppendUnlessSet(int fd, const char *key, const std::string &line)
{
    tavo::LineReader reader(fd);
    std::string_view old;
    while (reader.Next(old)) {
        if (tavo::LineSetsKey(old, key))
            return FailZero(ERR_KEY_EXISTS, Line{104});
    }
    if (reader.Failed())
        return Fail(ERR_READ_FAILED);
    return tavo::AppendText(fd, line) ? 1 : Fail(ERR_WRITE_FAILED, Line{82});
}

}  // namespace

extern "C" int TLIBFileAppendKey(const char *szPath, const char *szKey, const char *szValue, const char *szFormat)
{
    if (!szPath || !szKey || !szValue || !tavo::IsWritableKey(szKey) || !tavo::IsWritableValue(szValue))
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const std::optional<std::string> line = tavo::FormatLine(szFormat, szKey, szValue);
        if (!line)
            return Fail(ERR_BAD_PARAMETERS);
        const tavo::Fd fd = tavo::OpenToAppend(szPath);
        if (!fd && errno == ENOENT)
            return CreateWith(szPath, *line);
        if (!fd)
            return Fail(errno == EISDIR ? ERR_BAD_PARAMETERS : ERR_OPEN_FAILED);
        return AppendUnlessSet(fd.Get(), szKey, *line);
    });
}
