// Searches a file for one line.
#ifndef TAVO_CORE_DETAIL_LINE_SEARCH_H
#define TAVO_CORE_DETAIL_LINE_SEARCH_H

#include "core/detail/result.h"
#include "core/detail/where.h"

#include <string>
#include <string_view>

namespace tavo {

struct FoundLine {
    int number = 0;    // from 1
    std::string text;  // without its newline, up to its first NUL byte
};

enum class Match { first, last };

// ERR_OPEN_FAILED, ERR_READ_FAILED or, when there is no such line, ERR_KEY_NOT_FOUND.
Result<FoundLine> FindLineByNumber(const char *path, int number);
Result<FoundLine> FindLineByKey(const char *path, std::string_view key, Match which);

// Reports a failed search: 0 when there is no such line, -1 for another code.
int ReportSearch(Code failure, Where where = Where()) noexcept;

// Copies text with a NUL to a caller's buffer of `size` bytes and returns its length with the NUL. A missing or too
// small buffer is not touched.
int CopyOut(std::string_view text, char *buffer, int size);

}  // namespace tavo

#endif
