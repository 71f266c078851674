// A file of another program whose lines begin with users' names: read when it is first asked for, and written once,
// however many users change.
#ifndef TAVO_ACCOUNT_DETAIL_NAME_LINES_H
#define TAVO_ACCOUNT_DETAIL_NAME_LINES_H

#include "account/detail/account_commit.h"
#include "core/detail/result.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace tavo {

class NameLines {
  public:
    explicit NameLines(const char *path) : path_(path) {}

    // False when the file is there and cannot be read. A missing one has no lines.
    bool Read();

    // Replaces each line of `name` by the result of `change`, line ends included; "" removes it. Returns whether there
    // was one.
    bool Change(const std::string &name, const std::function<std::string(std::string_view line)> &change);

    void Append(const std::string &line);

    bool IsUnreadable() const { return state_ == kUnreadable; }
    bool IsChanged() const { return changed_; }

    // Adds the new file to a commit, when it has changed. 0 or a code of AccountCommit::WriteNeighbour.
    Code Compose(unsigned target, mode_t mode_of_new, AccountCommit &commit);

  private:
    const char *path_;
    FileRewrite file_;
    std::vector<std::string> lines_;
    enum { kUnread, kRead, kUnreadable } state_ = kUnread;
    bool changed_ = false;
};

}  // namespace tavo

#endif
