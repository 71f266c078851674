// The environment of programs that run detached from their caller: its PATH, if it has one, and nothing else.
#ifndef TAVO_CORE_DETAIL_PATH_ONLY_ENVIRONMENT_H
#define TAVO_CORE_DETAIL_PATH_ONLY_ENVIRONMENT_H

#include <cstring>

#include <unistd.h>

namespace tavo {

class PathOnlyEnvironment {
  public:
    PathOnlyEnvironment() noexcept
    {
        for (char **entry = environ; entry && *entry && !variables_[0]; ++entry) {
            if (std::strncmp(*entry, "PATH=", 5) == 0)
                variables_[0] = *entry;
        }
    }

    char *const *Variables() const noexcept { return variables_; }

  private:
    char *variables_[2] = {};
};

}  // namespace tavo

#endif
