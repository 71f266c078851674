// The argument vector of a program from a variable argument list.
#ifndef TAVO_CORE_DETAIL_ARGUMENT_LIST_H
#define TAVO_CORE_DETAIL_ARGUMENT_LIST_H

#include <cstdarg>
#include <cstddef>

namespace tavo {

// The program's path, then the arguments up to the first NULL, at most kMost of them.
template <size_t kMost>
class ArgumentList {
  public:
    ArgumentList(const char *program, va_list list) noexcept
    {
        vector_[0] = const_cast<char *>(program);  // execve changes nothing
        for (size_t i = 1; i <= kMost && (vector_[i] = va_arg(list, char *)); ++i) {
        }
    }

    char *const *Vector() const noexcept { return vector_; }

  private:
    char *vector_[kMost + 2] = {};
};

}  // namespace tavo

#endif
