// The scratch file of a search for processes.
#ifndef TAVO_CORE_DETAIL_PS_SCRATCH_H
#define TAVO_CORE_DETAIL_PS_SCRATCH_H

#include "core/detail/owner.h"

#include <string>

namespace tavo {

// Created with mode 0600; removed when the search ends.
class PsScratch {
  public:
    explicit PsScratch(std::string path);
    ~PsScratch();
    PsScratch(const PsScratch &) = delete;
    PsScratch &operator=(const PsScratch &) = delete;

    explicit operator bool() const { return static_cast<bool>(fd_); }

    // Returns whether another user's file has the usual name; the file is then beside it, if it could be created.
    bool IsTaken() const { return is_taken_; }
    const std::string &Path() const { return path_; }

    // Opens the file under its name, if the name still leads to the file that was created.
    File Reopen() const;

  private:
    std::string path_;
    Fd fd_;
    bool is_taken_ = false;
};

}  // namespace tavo

#endif
