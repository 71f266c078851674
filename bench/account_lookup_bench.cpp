// Looking up one user of 2,000 by name, with its lock, against the C library's readers of the files; and, as root and
// without root, whether there is one.
// Changes the accounts of the root that it runs in.
#include "tavo_user.h"

#include "compare.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <pwd.h>
#include <shadow.h>
#include <unistd.h>

namespace {

constexpr int kUsers = 2000;
constexpr char wanted[] = "user1000";

bool AddUsers()
{
    std::vector<std::string> names;
    for (int i = 0; i < kUsers; ++i)
        names.push_back("user" + std::to_string(i));
    std::vector<TAVOUSER> users;
    for (const std::string &name : names) {
        TAVOUSER user = {};
        user.szName = const_cast<char *>(name.c_str());
        user.nUid = user.nGid = user.nExpired = -1;
        users.push_back(user);
    }
    std::vector<const TAVOUSER *> records;
    for (const TAVOUSER &user : users)
        records.push_back(&user);
    const std::vector<const char *> old_names(records.size());
    return TAVOUserSet(old_names.data(), records.data(), kUsers) == 0;
}

uint64_t Tavo()
{
    TAVOUSER *user = nullptr;
    const uint64_t uid = TAVOUserGet(wanted, &user) == 0 ? static_cast<uint64_t>(user->nUid) : 0;
    TAVOUserFree(user);
    return uid;
}

uint64_t Getpwnam()
{
    const passwd *user = ::getpwnam(wanted);
    return user ? uint64_t{user->pw_uid} : 0;
}

uint64_t IsThere()
{
    const char *const names[] = {wanted, nullptr};
    char found[sizeof wanted];
    const int length = TAVOUserGetValidUserList(names, found, sizeof found);
    return length > 0 ? static_cast<uint64_t>(length) : 0;
}

uint64_t LengthOfName()
{
    const passwd *user = ::getpwnam(wanted);
    return user ? std::strlen(user->pw_name) + 1 : 0;
}

// The work as a program of a user without rights does it: from the text files, without lock and stores.
uint64_t WithoutRoot(uint64_t (*work)())
{
    constexpr uid_t nobody = 65534;
    if (::seteuid(nobody) != 0)
        return 0;
    const uint64_t result = work();
    return ::seteuid(0) == 0 ? result : 0;
}

}  // namespace

int main(int argc, char **argv)
{
    if (!std::getenv("TAVO_ROOT_FORM") || !AddUsers()) {
        std::fprintf(stderr, "account_lookup_bench: run me in an appliance root: tools/appliance/enter\n");
        return 1;
    }
    bench::Compare("look_up_user", kUsers,
                   {{"tavo", Tavo}, {"getpwnam", Getpwnam}, {"getpwnam+getspnam", [] {
                                                                 return ::getspnam(wanted) ? Getpwnam() : 0;
                                                             }}});
    bench::Compare("user_is_there", kUsers, {{"tavo", IsThere}, {"getpwnam", LengthOfName}});
    bench::Compare("the_same_without_root", kUsers,
                   {{"tavo",
                     [] {
                         return WithoutRoot(IsThere);
                     }},
                    {"getpwnam", [] {
                         return WithoutRoot(LengthOfName);
                     }}});
    return bench::Run(argc, argv);
}
