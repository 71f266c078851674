// Changes of accounts take the locks in one order, so that they cannot deadlock.
#include "tavo_lock.h"

#include "account/group/group_fixture.h"
#include "support/story.h"
#include "support/test.h"

#include <dlfcn.h>
#include <sys/file.h>

namespace {

std::vector<std::string> steps;  // what was taken and given back, in order: "+lock_pw", "~" when it is shared

}  // namespace

// Takes the place of flock: notes which lock file it was. Temporary files are locked too, while they live.
extern "C" int flock(int fd, int operation) noexcept
{
    static const auto real = reinterpret_cast<int (*)(int, int)>(::dlsym(RTLD_NEXT, "flock"));
    const int result = real(fd, operation);
    if (result == 0) {
        std::error_code ignored;
        const auto path = std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(fd), ignored);
        if (path.parent_path() == "/tmp/lock")
            steps.push_back((operation & LOCK_UN ? "-" : operation & LOCK_SH ? "~" : "+") + path.filename().string());
    }
    return result;
}

namespace {

class AccountLocks : public testing::Test {
  protected:
    test::Story story_{TEST_GOLDEN, {[] {
                           return std::exchange(steps, {});
                       }}};
};

// Those of the users, of the groups, of Samba: no call takes an earlier one while it has a later one.
TEST_F(AccountLocks, AreTakenInOneOrder)
{
    ASSERT_TRUE(test::GetGroup("users"));
    TELL(test::SetUsers({{"", "alice"}}, "x"));
    TELL(test::AddGroup("staff", -1, {"alice"}));
    TELL(TAVOGroupDescSet("staff", "text"));
    TELL(test::SetUsers({{"alice", "alina"}}, "x"));
    TELL(test::SetGroup("staff", "crew", -1, {"alina"}));
    TAVOUSER user = {};
    user.szName = const_cast<char *>("alina");
    const TAVOUSER *users[] = {&user};
    const char *const hash[] = {"$1$ab$abcdefghijklmnopqrstuv"};
    const char *const samba[] = {"0123456789ABCDEF0123456789ABCDEF"};
    TELL(TAVOUserSetPasswd(users, hash, samba, samba, 1));
    TELL(TAVOUserLockSet("alina", 1));
    TELL(test::GetUser("alina") != nullptr);
    TELL(TAVOGroupTotalNum(TAVO_GROUP_LOCAL));
    TELL(test::DeleteGroups({"crew"}));
    TELL(test::DeleteUser("alina"));
}

}  // namespace
