// Passwords: from a terminal or from standard input, never from the command line, where everybody sees them.
#ifndef TAVOCTL_PASSWORD_H
#define TAVOCTL_PASSWORD_H

#include "frame/arguments.h"

#include <string>

namespace tavoctl {

// The first line of standard input; at a terminal asked for twice, without being shown. Throws a Failure when there is
// none or it is empty.
std::string AskPassword(const std::string &name);

// Thirty-two random characters.
std::string UnknownPassword();

// The options of a verb that gives accounts a password.
class PasswordChoice {
  public:
    explicit PasswordChoice(Arguments &in);
    std::string For(const std::string &name) const;
    // Also without a terminal to ask at.
    bool IsMade() const { return *empty_ || *unknown_; }

  private:
    Given<bool> empty_;
    Given<bool> unknown_;
};

}  // namespace tavoctl

#endif
