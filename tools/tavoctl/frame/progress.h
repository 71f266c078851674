// One line on standard error about long work; nothing when that is not a terminal.
#ifndef TAVOCTL_PROGRESS_H
#define TAVOCTL_PROGRESS_H

#include <string>

namespace tavoctl {

class Progress {
  public:
    explicit Progress(std::string what) : what_(std::move(what)) {}
    ~Progress();  // takes the line away
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

    static bool Visible();
    // "WHAT: state", in the place of what stood there.
    void Show(const std::string &state);

  private:
    std::string what_;
    bool shown_ = false;
};

}  // namespace tavoctl

#endif
