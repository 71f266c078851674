// tavoctl's own rules and warnings for accounts, beyond those of the library.
#ifndef TAVOCTL_ACCOUNT_RULES_H
#define TAVOCTL_ACCOUNT_RULES_H

#include "tavo_error.h"

#include "frame/failure.h"

#include <string>
#include <utility>
#include <vector>

namespace tavoctl {

// The names of entries of a batch that failed, with the reasons. A batch of the library records the reason of its last one
// alone: each is tried once more by itself.
using EntryFailures = std::vector<std::pair<std::string, Failure>>;

// Tries that: `call` of the library, and whether the entry is as it should be then. Adds a failure.
template <class Call, class IsDone>
void TryAgain(const std::string &name, const std::string &attempted, EntryFailures &failures, Call call, IsDone is_done)
{
    TLIBErrSet(ERR_SUCCESS);
    const bool called = call() == 0;
    const Failure failure = LibraryFailure(attempted);
    if (!called || !is_done())
        failures.emplace_back(name, failure);
}

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

// Deletes accounts or groups by the library's function for that, in one batch; `noun` is "user" or "group". Returns
// those that are still there. Throws a Failure when nothing was deleted.
EntryFailures DeleteAll(const std::vector<std::string> &names, int (*remove)(const char *const *, int),
                        bool (*is_there)(const std::string &), const std::string &noun);

// The key under which a name is stored: the name in upper case, or unchanged when it cannot be converted.
std::string AccountKey(const std::string &name);

}  // namespace tavoctl

#endif
