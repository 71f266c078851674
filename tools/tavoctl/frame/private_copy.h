// A copy of a file in a directory of its own, for trying out what a change would make of it.
#ifndef TAVOCTL_PRIVATE_COPY_H
#define TAVOCTL_PRIVATE_COPY_H

#include <string>

namespace tavoctl {

class PrivateCopy {
  public:
    // A file that is not there has a copy that is not there. Throws a Failure when the file cannot be read, or could
    // not be created where it is missing.
    explicit PrivateCopy(std::string original);
    ~PrivateCopy();
    PrivateCopy(const PrivateCopy &) = delete;
    PrivateCopy &operator=(const PrivateCopy &) = delete;

    const std::string &Path() const { return copy_; }
    // From the original to the present copy.
    std::string Difference() const;

  private:
    std::string original_;
    bool existed_;
    std::string text_;
    std::string folder_;
    std::string copy_;
};

}  // namespace tavoctl

#endif
