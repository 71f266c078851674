// tavoctl's own rules and warnings for accounts, beyond those of the library.
#ifndef TAVOCTL_ACCOUNT_RULES_H
#define TAVOCTL_ACCOUNT_RULES_H

#include <string>
#include <vector>

namespace tavoctl {

// The first few of the names, with commas between them.
std::string SomeOf(const std::vector<std::string> &names);

// Digits only, blanks, and characters that may look like others.
void WarnOfName(const std::string &name);

// The user id assigned last, from /etc/tavouser.conf; -1 when it is not recorded.
int LastUserId();

// Ids of deleted users come back once all are used up; their files are still theirs.
void WarnOfReusedId(const std::string &name, int uid, int last_before);

// Throws a Failure when another account has the id: each would own the files of the other.
void RefuseTakenId(const std::string &name, int uid);

// Throws a Failure when the model allows fewer than so many further accounts.
void RefuseTooMany(int additions, const std::string &attempted);

// Deletes accounts or groups by the library's function for that, in one batch. Throws a Failure when it fails, or when
// one of them still exists afterwards.
void DeleteAll(const std::vector<std::string> &names, int (*remove)(const char *const *, int),
               bool (*is_there)(const std::string &), const std::string &attempted);

}  // namespace tavoctl

#endif
