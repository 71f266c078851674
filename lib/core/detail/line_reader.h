// Reads an open file line by line. Lines may have any length and hold any byte.
#ifndef TAVO_CORE_DETAIL_LINE_READER_H
#define TAVO_CORE_DETAIL_LINE_READER_H

#include "core/detail/owner.h"

#include <cstddef>
#include <string_view>

namespace tavo {

// A settings file is never larger; a larger text is refused as if memory had run out, before memory does.
inline constexpr size_t kLargestText = size_t{256} << 20;

// Cuts the next line, with its newline if it has one, off a text.
inline std::string_view TakeWholeLine(std::string_view &rest)
{
    const size_t newline = rest.find('\n');
    const std::string_view line = rest.substr(0, newline == rest.npos ? rest.size() : newline + 1);
    rest.remove_prefix(line.size());
    return line;
}

inline std::string_view WithoutNewline(std::string_view line)
{
    return line.ends_with('\n') ? line.substr(0, line.size() - 1) : line;
}

class LineReader {
  public:
    // Does not take ownership of the descriptor.
    explicit LineReader(int fd) noexcept : fd_(fd) {}

    // Returns the next line, with its newline if it has one, valid until the next call. False at the end of the file
    // and after a read error.
    bool Next(std::string_view &line)
    {
        if (line = TakeWholeLine(unread_); line.ends_with('\n'))
            return true;
        unread_ = line;
        if (!ReadMore())
            return false;
        line = TakeWholeLine(unread_);
        return true;
    }

    bool Failed() const noexcept { return failed_; }

  private:
    bool ReadMore();  // reads until the buffer holds a newline or the end; false when nothing is left

    int fd_;
    bool failed_ = false;
    HeapBlock<char> buffer_;
    size_t capacity_ = 0;
    std::string_view unread_;
};

}  // namespace tavo

#endif
