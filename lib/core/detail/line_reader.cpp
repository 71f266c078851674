// Reads an open file line by line.
#include "core/detail/line_reader.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <new>

#include <unistd.h>

namespace tavo {
namespace {

constexpr size_t kFirstCapacity = 16384;  // most settings files in one read

}  // namespace

bool LineReader::ReadMore()
{
    size_t kept = unread_.size();
    if (kept > 0)
        std::memmove(buffer_.Get(), unread_.data(), kept);
    for (bool ended = failed_; !ended;) {
        if (kept == capacity_) {
            if (capacity_ >= kLargestText)
                throw std::bad_alloc();
            const size_t capacity = capacity_ ? capacity_ * 2 : kFirstCapacity;
            char *const larger = static_cast<char *>(std::realloc(buffer_.Get(), capacity));
            if (!larger)
                throw std::bad_alloc();
            buffer_.Release();
            buffer_.Reset(larger);
            capacity_ = capacity;
        }
        const ssize_t got = ::read(fd_, buffer_.Get() + kept, capacity_ - kept);
        if (got < 0 && errno == EINTR)
            continue;
        failed_ = got < 0;
        ended = got <= 0 || std::memchr(buffer_.Get() + kept, '\n', static_cast<size_t>(got));
        kept += got > 0 ? static_cast<size_t>(got) : 0;
    }
    unread_ = {buffer_.Get(), kept};
    return kept > 0 && !failed_;
}

}  // namespace tavo
