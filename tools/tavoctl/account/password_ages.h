// The validity of passwords, and whether Samba accepts an account: facts that records of users do not have.
#ifndef TAVOCTL_PASSWORD_AGES_H
#define TAVOCTL_PASSWORD_AGES_H

#include <map>
#include <optional>
#include <string>

namespace tavoctl {

// In days; nothing where the shadow file has no number.
struct PasswordAges {
    std::optional<int> least, most, warning;

    // An account whose password is fixed has a least age that the most never reaches.
    bool IsFixed() const;
    bool IsUsual() const;  // as the library writes them
};

using AgesByKey = std::map<std::string, PasswordAges>;

AgesByKey ReadPasswordAges();  // of every line of the shadow file
PasswordAges AgesOf(const std::string &user);

// Restores the ages that an account had under its old name: the library's other changes write the usual ones. Throws a
// Failure.
void RestoreAges(const AgesByKey &before, const std::string &old_name, const std::string &name);

// "on", or "disabled"; "none" for an account that Samba does not know.
std::string SambaState(const std::string &user);

}  // namespace tavoctl

#endif
