// Searches a file for one line. Returns codes for the caller to report: 0, ERR_OPEN_FAILED, ERR_READ_FAILED or, when
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

// Copies text with a NUL to a caller's buffer of `size` bytes and returns its length with the NUL. A missing or too
// small buffer is not touched.
int CopyOut(std::string_view text, char *buffer, int size);

}  // namespace tavo

#endif
