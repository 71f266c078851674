// Searches a file for one line.
#include "core/detail/line_search.h"

#include "tavo_error.h"

#include "core/detail/fault.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"

namespace tavo {
namespace {

template <class Wanted>
Result<FoundLine> FindLine(const char *path, Match which, Wanted &&wanted)
{
    const Fd fd = OpenRegular(path, O_RDONLY);
    if (!fd)
        return Code(ERR_OPEN_FAILED);
    LineReader reader(fd.Get());
    FoundLine found;
    std::string_view line;
    for (int number = 1; reader.Next(line); ++number) {
        if (!wanted(number, line))
            continue;
        found.number = number;
        found.text = UpToNul(WithoutNewline(line));
        if (which == Match::first)
            return found;
    }
    if (reader.Failed())
        return Code(ERR_READ_FAILED);
    if (!found.number)
        return Code(ERR_KEY_NOT_FOUND);
    return found;
}

}  // namespace

Result<FoundLine> FindLineByNumber(const char *path, int number)
{
    return FindLine(path, Match::first, [&](int at, std::string_view) { return at == number; });
}

Result<FoundLine> FindLineByKey(const char *path, std::string_view key, Match which)
{
    return FindLine(path, which, [&](int, std::string_view line) { return LineSetsKey(line, key); });
}

int ReportSearch(Code failure, Where where) noexcept
{
    return failure == ERR_KEY_NOT_FOUND ? FailNone(failure, where) : Fail(failure, where);
}

int CopyOut(std::string_view text, char *buffer, int size)
{
    const int length = static_cast<int>(text.size()) + 1;  // no line is longer than kLargestText
    if (buffer && length <= size) {
        text.copy(buffer, text.size());
        buffer[text.size()] = '\0';
    }
    return length;
}

}  // namespace tavo
