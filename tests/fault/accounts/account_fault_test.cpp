// Users, groups, quotas and stores when memory runs out or a system call fails, once, at every place, with stores that are
// ready and with stores that must be built: no crash, no leak; a success has the right answer and the new files in
// every file that knows accounts, a failure says why and leaves the old ones.
#include "tavo_bdb.h"
#include "tavo_group.h"
#include "tavo_quota.h"
#include "tavo_user.h"

#include "account/group/group_fixture.h"
#include "account/known_everywhere.h"
#include "support/failing_malloc.h"
#include "support/test.h"
#include "support/traced_call.h"

#include <sys/mman.h>

// Hashes take their salt from the clock.
extern "C" time_t time(time_t *out) noexcept
{
    constexpr time_t now = 1700000000;
    if (out)
        *out = now;
    return now;
}

namespace {

using test::Everything;
using test::Files;

// What a call came to, in memory that outlives it.
struct Outcome {
    bool fired;
    bool came_back;
    int result;
    int code;
    int left;
    bool logged_home;  // that a home folder could not be looked for, and stays
    char answer[1024];

    void Say(const char *text)
    {
        std::strncat(answer, text ? text : "(null)", sizeof answer - std::strlen(answer) - 1);
        std::strncat(answer, "|", sizeof answer - std::strlen(answer) - 1);
    }
    void Say(int number)
    {
        char text[16];
        std::snprintf(text, sizeof text, "%d", number);
        Say(static_cast<const char *>(text));
    }
};

std::string Hex(int code)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%04X", static_cast<unsigned>(code));
    return text;
}

int Set(const char *old_name, const char *name, const char *password)
{
    TAVOUSER user = {};
    user.szName = const_cast<char *>(name);
    user.szPasswd = const_cast<char *>(password);
    user.nUid = user.nGid = user.nExpired = -1;
    return TAVOUserSetOne(old_name, &user);
}

int SetGroup(const char *old_name, const char *name)
{
    char member[] = "alice";
    char *members[] = {member, nullptr};
    const TAVOGROUP group = {const_cast<char *>(name), -1, members, 0, 0};
    return TAVOGroupSet(old_name, &group);
}

// Each takes a function and its arguments before the last one.
template <class Function, class Key>
int ShowUser(Outcome &outcome, Function get, Key key)
{
    TAVOUSER *user = nullptr;
    const int result = get(key, &user);
    if (result == 0) {
        for (const char *text : {user->szName, user->szPasswd, user->szHome, user->szMail})
            outcome.Say(text);
        outcome.Say(user->nUid);
        outcome.Say(user->nPrivilege);
    }
    TAVOUserFree(user);
    return result;
}

template <class Function, class Key>
int ShowGroup(Outcome &outcome, Function get, Key key)
{
    TAVOGROUP *group = nullptr;
    const int result = get(key, &group);
    if (result == 0) {
        outcome.Say(group->szName);
        for (char **member = group->rgszMember; *member; ++member)
            outcome.Say(*member);
    }
    TAVOGroupFree(group);
    return result;
}

template <class Function, class Key>
int ShowText(Outcome &outcome, Function get, Key key)
{
    char text[64] = "";
    const int length = get(key, text, sizeof text);
    outcome.Say(length < 0 ? "" : text);
    return length < 0 ? -1 : 0;
}

template <class List>
int ShowList(Outcome &outcome, List list)
{
    TLIBSZLIST *names = PslTLIBSzListAlloc(1024);
    const int count = names ? list(&names) : -1;
    for (int i = 0; i < count; ++i)
        outcome.Say(SzTLIBSzListGet(names, i));
    TLIBSzListFree(names);
    return count < 0 ? -1 : 0;
}

int ShowNumber(Outcome &outcome, int result)
{
    outcome.Say(result);
    return result < 0 ? -1 : 0;
}

int UseStore(Outcome &outcome)
{
    TAVOBDB *store = TAVOBDbOpen("/tmp/own.db", O_RDWR | O_CREAT, 1);
    if (!store)
        return -1;
    void *value = nullptr;
    int length = 0;
    int result = TAVOBDbSet(store, "KEY", 3, "value", 6);
    if (result == 0)
        result = TAVOBDbGet(store, "KEY", 3, &value, &length);
    if (result == 0)
        outcome.Say(static_cast<const char *>(value));
    TAVOBDbFree(value);
    if (result == 0)
        result = TAVOBDbDelete(store, "KEY", 3);
    return TAVOBDbClose(store) == 0 ? result : -1;
}

struct Call {
    const char *name;
    int (*call)(Outcome &);
    bool changes = false;
};

int SetPassword()
{
    TAVOUSER user = {};
    user.szName = const_cast<char *>("alice");
    const TAVOUSER *const users[] = {&user};
    const char *const hash[] = {"$1$ab$0123456789012345678901"};
    const char *const digits[] = {"0123456789ABCDEF0123456789ABCDEF"};
    return TAVOUserSetPasswd(users, hash, digits, digits, 1);
}

const char *const kAlice[] = {"alice"};
const char *const kStaff[] = {"staff"};
const char *const kNames[] = {"alice", "nobody else", "bob", nullptr};

#define READS(expression)                                                                                              \
    [](Outcome &outcome) -> int {                                                                                      \
        return expression;                                                                                             \
    }
#define CHANGES(expression) [](Outcome &) -> int { return expression; }, true

constexpr Call kCalls[] = {
    {"get user", READS(ShowUser(outcome, TAVOUserGet, "alice"))},
    {"get user with accents", READS(ShowUser(outcome, TAVOUserGet, "zo\xC3\xAB"))},
    {"get user by id", READS(ShowUser(outcome, TAVOUserGetByUID, 1025))},
    {"list users", READS(ShowList(outcome, [](auto **names) { return TAVOUserEnum(names, TAVO_USER_LOCAL); }))},
    {"count users", READS(ShowNumber(outcome, TAVOUserTotalNum(TAVO_USER_LOCAL)))},
    {"privilege", READS(ShowNumber(outcome, TAVOUserPrivilegeGet("alice")))},
    {"expiry", READS(ShowNumber(outcome, TAVOUserCheckExpired("alice")))},
    {"valid users", READS(ShowText(outcome, TAVOUserGetValidUserList, kNames))},
    {"get group", READS(ShowGroup(outcome, TAVOGroupGet, "staff"))},
    {"get group by id", READS(ShowGroup(outcome, TAVOGroupGetByGID, 101))},
    {"list groups", READS(ShowList(outcome, [](auto **names) { return TAVOGroupEnum(names, TAVO_GROUP_LOCAL); }))},
    {"list members", READS(ShowList(outcome, [](auto **names) { return TAVOGroupListMember("staff", names); }))},
    {"list everybody", READS(ShowList(outcome, [](auto **names) { return TAVOGroupListMember("users", names); }))},
    {"describe group", READS(ShowText(outcome, TAVOGroupDescGet, "staff"))},
    {"model's quotas", READS(ShowNumber(outcome, TAVOSupportQUOTA()))},
    {"own store", UseStore},
    {"add user", CHANGES(Set(nullptr, "dave", "dave"))},
    {"change user", CHANGES(Set("bob", "bob", "other"))},
    {"rename user", CHANGES(Set("alice", "anna", "x"))},
    {"set password", CHANGES(SetPassword())},
    {"lock user", CHANGES(TAVOUserLockSet("alice", 1))},
    {"age password", CHANGES(TAVOUserAgingSet("alice", 1, 90, 14))},
    {"delete user", CHANGES(TAVOUserDelete(kAlice, 1))},
    {"add group", CHANGES(SetGroup(nullptr, "crew"))},
    {"rename group", CHANGES(SetGroup("staff", "crew"))},
    {"describe", CHANGES(TAVOGroupDescSet("staff", "new"))},
    {"delete group", CHANGES(TAVOGroupDelete(kStaff, 1))},
};

#undef READS
#undef CHANGES

bool Long()
{
    return std::getenv("TAVO_LONG_TESTS") != nullptr;
}

// One call alone, to look into its faults.
bool IsAsked(const Call &call)
{
    const char *only = std::getenv("TAVO_CALL");
    return !only || std::string_view(only) == call.name;
}

// Which of the faults a short run takes: others with another seed, the same ones with the same.
class Sample {
  public:
    Sample(const Call &call, bool ready)
    {
        const char *seed = std::getenv("TAVO_TEST_SEED");
        state_ = static_cast<unsigned>(seed ? std::atoi(seed) : 13) * 2654435761u;
        for (const char *at = call.name; *at; ++at)
            state_ = (state_ ^ static_cast<unsigned char>(*at)) * 16777619u;
        state_ += ready ? 1 : 0;
    }
    int Step(int most)
    {
        state_ = state_ * 1664525u + 1013904223u;
        return Long() ? 1 : 1 + static_cast<int>((state_ >> 16) % static_cast<unsigned>(most));
    }

  private:
    unsigned state_;
};

// Stores as a call finds them usually, or such that it has to build them.
void MakeReady(bool ready)
{
    TAVOUSER *user = nullptr;
    ASSERT_EQ(TAVOUserGet("bob", &user), 0);
    TAVOUserFree(user);
    ASSERT_GE(TAVOGroupTotalNum(1), 0);
    ::unlink("/tmp/own.db");
    if (!ready) {
        ::unlink("/tmp/.db.user.seal");
        ::unlink("/tmp/.db.group.seal");
    }
}

bool MarkerIsThere()
{
    return ::access("/etc/.tavoaccount.commit", F_OK) == 0;
}

class Faults : public testing::Test {
  protected:
    void SetUp() override
    {
        test::StartKnownEverywhere();
        ASSERT_EQ(test::AddUser("zo\xC3\xAB"), 0);
        before_ = Everything();
        outcome_ = static_cast<Outcome *>(
            ::mmap(nullptr, sizeof(Outcome), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
        ASSERT_NE(outcome_, MAP_FAILED);
    }
    void TearDown() override { ::munmap(outcome_, sizeof *outcome_); }

    void Begin(bool ready)
    {
        ::unlink("/etc/.tavoaccount.commit");
        test::PutBack(before_);
        ASSERT_NO_FATAL_FAILURE(MakeReady(ready));
        *outcome_ = {};
    }

    // What the call does when nothing fails.
    void Undisturbed(const Call &call)
    {
        ASSERT_NO_FATAL_FAILURE(Begin(true));
        ASSERT_EQ(call.call(*outcome_), 0);
        after_ = Everything();
        answer_ = outcome_->answer;
        EXPECT_EQ(after_ != before_, call.changes);
        EXPECT_EQ(answer_.empty(), call.changes);
    }

    // A success is whole, at once or after the next change; a failure has changed nothing, and nothing follows from it. An
    // entry that failed by itself leaves its code beside the 0 of its batch.
    void ExpectOldOrNew(const std::string &where)
    {
        const int result = outcome_->result;
        const int code = outcome_->code;
        SCOPED_TRACE(where + " result " + std::to_string(result) + " code " + Hex(code));
        EXPECT_TRUE(result == 0 || code != 0) << "a failure without a reason";
        const bool undecided = result == -1 && code == ERR_RENAME_FAILED;
        EXPECT_TRUE(result == 0 || undecided || !MarkerIsThere()) << "a failure that the next change completes";
        EXPECT_EQ(test::NextChange(), 0);
        Files found = Everything();
        const bool done = result == 0 || code == ERR_UNLOCK_FAILED;  // that comes when all is done
        const auto is_new = [&](const char *path) {
            return found.at(path) == after_.at(path);
        };
        if (done && is_new("/etc/passwd") && is_new("/etc/shadow")) {
            ForgivePasswords(found);
            if (outcome_->logged_home)
                ForgiveHomes(found);
        }
        if ((result == 0 && code == 0) || code == ERR_UNLOCK_FAILED) {
            EXPECT_EQ(test::Difference(found, after_), "");
            EXPECT_EQ(outcome_->answer, answer_);
        } else if (result == 0 || undecided) {
            EXPECT_TRUE(found == before_ || found == after_) << test::Difference(found, before_) << "\nnor\n"
                                                             << test::Difference(found, after_);
        } else {
            EXPECT_EQ(test::Difference(found, before_), "");
        }
    }

    // No password is written down to be finished later: where the backup service's file could not be changed, a later change
    // brings the names alone.
    void ForgivePasswords(Files &found) const
    {
        constexpr char passwords[] = "/etc/rsyncd.secrets";
        std::string text = found.at(passwords);
        if (const size_t at = text.find("anna:secret"); at != text.npos)
            text.replace(at, 11, "alice:secret");
        if (text == before_.at(passwords))
            found[passwords] = after_.at(passwords);
    }

    // A folder that cannot be looked for is logged and stays.
    void ForgiveHomes(Files &found) const
    {
        const auto is_home = [](const auto &file) {
            return file.first.find("/homes/") != file.first.npos;
        };
        std::erase_if(found, is_home);
        for (const auto &file : after_)
            if (is_home(file))
                found.insert(file);
    }

    Files before_;
    Files after_;
    std::string answer_;
    Outcome *outcome_ = nullptr;
};

TEST_F(Faults, EveryAllocation)
{
    const test::CapturedLog silence;
    for (const Call &call : kCalls) {
        if (!IsAsked(call))
            continue;
        SCOPED_TRACE(call.name);
        ASSERT_NO_FATAL_FAILURE(Undisturbed(call));
        for (const bool ready : {true, false}) {
            Sample sample(call, ready);
            int n = 1;
            for (;; n += sample.Step(call.changes ? 60 : 12)) {
                ASSERT_NO_FATAL_FAILURE(Begin(ready));
                const pid_t child = ::fork();
                if (child == 0) {
                    Outcome outcome = {};
                    TLIBErrSet(0);
                    test::StartCounting();
                    test::FailAllocation(n);
                    const int result = call.call(outcome);
                    test::StopFailing();
                    const int left = test::StopCounting();
                    outcome.fired = test::AllocationFailed();
                    outcome.came_back = true;
                    outcome.result = result;
                    outcome.code = TLIBErrGet();
                    outcome.left = left;
                    *outcome_ = outcome;
                    ::_exit(0);
                }
                int status = 0;
                ::waitpid(child, &status, 0);
                const std::string where = "allocation " + std::to_string(n) + (ready ? "" : ", stale");
                EXPECT_EQ(status, 0) << where;
                if (status != 0)
                    continue;
                if (!outcome_->fired)
                    break;
                EXPECT_LE(outcome_->left, 0) << where << " left allocated";
                // Closing a store has one code of its own, and so has a deleted user's home that stays for now.
                const bool refused = outcome_->result != 0 || outcome_->code != 0;
                const bool home_stays = outcome_->result == 0 && outcome_->code == ERR_REMOVE_FAILED;
                if ((outcome_->code != ERR_DB_CLOSE || call.call != UseStore) && !home_stays) {
                    EXPECT_EQ(Hex(outcome_->code), Hex(refused ? ERR_OUT_OF_MEMORY : 0)) << where;
                }
                ExpectOldOrNew(where);
            }
            EXPECT_GT(n, 1);
        }
    }
}

// What a call says about accounts when all that is wrong is that a system call failed.
bool IsAboutAccounts(int code)
{
    const std::set<int> codes{ERR_NO_SUCH_USER,  ERR_NO_SUCH_GROUP,  ERR_USER_EXISTS,      ERR_GROUP_EXISTS,
                              ERR_KEY_NOT_FOUND, ERR_KEY_EXISTS,     ERR_INVALID_USERNAME, ERR_INVALID_GROUPNAME,
                              ERR_UNKNOWN,       ERR_BAD_PARAMETERS, ERR_FORMAT_ERROR};
    return codes.contains(code);
}

TEST_F(Faults, EverySystemCall)
{
    if (!test::CanTrace())
        GTEST_SKIP() << "no ptrace here";
    constexpr int kErrors[] = {EIO, ENOSPC, EACCES, EMFILE, EINTR};
    for (const Call &call : kCalls) {
        if (!IsAsked(call))
            continue;
        SCOPED_TRACE(call.name);
        ASSERT_NO_FATAL_FAILURE(Undisturbed(call));
        for (const bool ready : {true, false}) {
            const std::function<void()> work = [&] {
                const test::CapturedLog log;
                TLIBErrSet(0);
                test::MarkCalls();
                const int result = call.call(*outcome_);
                test::MarkCalls();
                outcome_->result = result;
                outcome_->code = TLIBErrGet();
                for (const std::string &line : log.Texts())
                    outcome_->logged_home |= line.find("look for the home folder") != line.npos;
                outcome_->came_back = true;
            };
            ASSERT_NO_FATAL_FAILURE(Begin(ready));
            std::vector<test::SystemCall> calls = test::SystemCallsOf(work);
            if (Long())
                std::erase_if(calls, [](const test::SystemCall &each) { return !test::CanFail(each); });
            else
                calls = test::DistinctCalls(calls);
            ASSERT_GE(calls.size(), 4u);
            Sample sample(call, ready);
            for (size_t pair = 0; pair < calls.size() * std::size(kErrors);
                 pair += static_cast<size_t>(sample.Step(call.changes ? 60 : 15))) {
                const test::SystemCall &failing = calls[pair / std::size(kErrors)];
                const int error = kErrors[pair % std::size(kErrors)];
                ASSERT_NO_FATAL_FAILURE(Begin(ready));
                const test::Ending ending = test::FailsAtCall(failing, error, work);
                const std::string where = failing.Name() + " " + std::to_string(failing.index) + ", " +
                                          ::strerrorname_np(error) + (ready ? "" : ", stale");
                EXPECT_TRUE(ending.IsClean() && outcome_->came_back) << where << " " << ending;
                if (!outcome_->came_back)
                    continue;
                EXPECT_FALSE(IsAboutAccounts(outcome_->code)) << where << " code " << Hex(outcome_->code);
                const std::set<std::string> writes{"write", "pwrite64", "fsync", "fdatasync"};
                if (error == ENOSPC && outcome_->result != 0 && writes.contains(failing.Name())) {
                    EXPECT_EQ(Hex(outcome_->code), Hex(ERR_NOT_ENOUGH_SPACE)) << where;
                }
                ExpectOldOrNew(where);
            }
        }
    }
}

}  // namespace
