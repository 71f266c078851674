// The files of users and groups as they were.
#ifndef TAVOCTL_ACCOUNT_FILES_H
#define TAVOCTL_ACCOUNT_FILES_H

#include "account/account_plans.h"

#include <csignal>

namespace tavoctl {

// Hold the locks of the accounts. While it lives, no signal from a terminal or its end stops the program half-way.
class AccountFiles {
  public:
    explicit AccountFiles(const UserPlan &plan);
    ~AccountFiles();
    AccountFiles(const AccountFiles &) = delete;
    AccountFiles &operator=(const AccountFiles &) = delete;

    // Files that differ get their old text, and new home folders go while they are empty. The library takes the files over
    // at its next call. Throws a Failure.
    void PutBack() const;

  private:
    struct OldFile {
        const char *path;
        std::optional<std::string> text;  // nothing: it was not there
    };
    std::vector<OldFile> files_;
    std::vector<std::string> new_homes_;
    sigset_t signals_;
};

}  // namespace tavoctl

#endif
