// The input of a fuzz target, taken piece by piece; past its end everything is 0 or empty.
#ifndef FUZZ_INPUT_H
#define FUZZ_INPUT_H

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

namespace fuzz {

class Input {
  public:
    Input(const uint8_t *data, size_t size) : at_(data), left_(size) {}

    bool Empty() const { return left_ == 0; }

    uint8_t Byte()
    {
        if (left_ == 0)
            return 0;
        --left_;
        return *at_++;
    }

    // A C string of at most `most` bytes; it ends early at a NUL.
    std::string Text(size_t most)
    {
        const size_t size = std::min<size_t>(left_, Byte() % (most + 1));
        std::string text(reinterpret_cast<const char *>(at_), std::min(size, left_));
        at_ += text.size();
        left_ -= text.size();
        return text.substr(0, text.find('\0'));
    }

    std::string Rest()
    {
        std::string text(reinterpret_cast<const char *>(at_), left_);
        left_ = 0;
        return text.substr(0, text.find('\0'));
    }

  private:
    const uint8_t *at_;
    size_t left_;
};

// The next field of an input that is text: fields end at a 0xFE byte.
inline std::string TakeField(std::string_view &rest)
{
    const size_t end = rest.find('\xFE');
    const std::string field(rest.substr(0, end));
    rest.remove_prefix(end == rest.npos ? rest.size() : end + 1);
    return field;
}

// A finding: says where and stops.
inline void Check(bool right, const char *what, int line = __builtin_LINE())
{
    if (!right) {
        std::fprintf(stderr, "line %d: %s\n", line, what);
        std::abort();
    }
}

}  // namespace fuzz

#endif
