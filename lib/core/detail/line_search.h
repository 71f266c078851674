// Looks for one line of a file. Codes are those that the caller reports: 0, ERR_OPEN_FAILED, ERR_READ_FAILED or, when
// there is no such line, ERR_KEY_NOT_FOUND.
#ifndef TAVO_CORE_DETAIL_LINE_SEARCH_H
#define TAVO_CORE_DETAIL_LINE_SEARCH_H

#include <string>
#include <string_view>

namespace tavo {

struct FoundLine {
    int number = 0;    // from 1
    std::string text;  // without its newline, up to its first NUL byte
};

enum class Match { first, last };

int FindLineByNumber(const char *path, int number, FoundLine &found);
int FindLineByKey(const char *path, std::string_view key, Match which, FoundLine &found);

// Copies text with a NUL to a caller's buffer of `size` bytes: its length with the NUL. The buffer is untouched when
// there is none, or when it is too small.
int CopyOut(std::string_view text, char *buffer, int size);

}  // namespace tavo

#endif
