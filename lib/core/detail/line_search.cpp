// Searches a file for one line.
#include "core/detail/line_search.h"

#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "tavo_error.h"

namespace tavo {
namespace {

template <class Wanted>
int FindLine(const char *path, Match which, FoundLine &found, Wanted &&wanted)
{
    const Fd fd = OpenRegular(path, O_RDONLY);
    if (!fd)
        return ERR_OPEN_FAILED;
    LineReader reader(fd.Get());
    std::string_view line;
    for (int number = 1; reader.Next(line); ++number) {
        if (!wanted(number, line))
            continue;
        found.number = number;
        found.text = UpToNul(WithoutNewline(line));
        if (which == Match::first)
            return 0;
    }
    if (reader.Failed())
        return ERR_READ_FAILED;
    return found.number ? 0 : ERR_KEY_NOT_FOUND;
}

}  // namespace

int FindLineByNumber(const char *path, int number, FoundLine &found)
{
    return FindLine(path, Match::first, found, [&](int at, std::string_view) { return at == number; });
}

int FindLineByKey(const char *path, std::string_view key, Match which, FoundLine &found)
{
    return FindLine(path, which, found, [&](int, std::string_view line) { return LineSetsKey(line, key); });
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
