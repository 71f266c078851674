// The calls of users and groups when memory runs out or a system call fails, once, at every place, with stores that are
// ready and with stores that must be built: no crash, no leak; a success has the right answer and the new files in
// every file that knows accounts, a failure says why and leaves the old ones.
#include "account/known_everywhere.h"
#include "account/user/as_nobody.h"
#include "fault/every_call/call.h"
#include "support/domain_entries.h"
#include "support/failing_malloc.h"
#include "support/story.h"
#include "support/test.h"
#include "support/traced_call.h"

#include <array>
#include <regex>

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

using every_call::Call;
using every_call::Report;
using every_call::Trial;
using test::Files;

std::string Hex(int code)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%04X", static_cast<unsigned>(code));
    return text;
}

bool Long()
{
    return std::getenv("TAVO_LONG_TESTS") != nullptr;
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

bool MarkerIsThere()
{
    return ::access("/etc/.tavoaccount.commit", F_OK) == 0;
}

// In memory that outlives the call.
struct Outcome {
    Report report;
    bool logged_home;  // that a home folder could not be looked for, and stays
};

const std::regex kCalls("TAVO(User|Group)(Enum|(Get|List|Total|Check|Privilege|Set|Lock|Aging|Delete|Desc).*)");

class Faults : public testing::Test {
  protected:
    void SetUp() override
    {
        ASSERT_NO_FATAL_FAILURE(test::StartKnownEverywhere());
        ASSERT_EQ(test::AddUser("zo\xC3\xAB"), 0);
        before_ = test::Everything();
        void *const shared =
            ::mmap(nullptr, sizeof(Outcome), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
        ASSERT_NE(shared, MAP_FAILED);
        outcome_ = static_cast<Outcome *>(shared);
    }
    void TearDown() override { ::munmap(outcome_, sizeof *outcome_); }

    // With stores as a call finds them usually, or such that it has to build them.
    void Begin(bool ready)
    {
        ::unlink("/etc/.tavoaccount.commit");
        test::PutBack(before_);
        ASSERT_TRUE(test::GetUser("bob"));
        ASSERT_GE(TAVOGroupTotalNum(1), 0);
        if (!ready)
            ForgetStores();
        *outcome_ = {};
    }

    static void ForgetStores()
    {
        for (const char *seal : {"/tmp/.db.user.seal", "/tmp/.db.group.seal"})
            ::unlink(seal);
    }

    void Make(const Call &call, Trial::Watch watch, int failing_allocation = 0)
    {
        Trial run(outcome_->report, watch, failing_allocation);
        call.body(run);
    }

    // Tries one call after the other, with ready stores and with stale ones. The body gets what its messages begin with.
    void OfEachCall(const std::function<void(const Call &, bool ready, const std::string &)> &body)
    {
        const test::CapturedLog silence;
        int changing = 0;
        for (const Call &call : every_call::AccountFamily().calls) {
            // Those that use the files and the stores beneath them by themselves, each in one way.
            const std::string name = call.name;
            const char *const only = std::getenv("TAVO_CALL");
            if (!std::regex_match(name, kCalls) || (only && name != only))
                continue;
            ASSERT_NO_FATAL_FAILURE(Begin(true));
            Make(call, Trial::Watch::nothing);
            clean_ = outcome_->report;
            ASSERT_FALSE(clean_.failed) << name;
            after_ = test::Everything();
            changing += after_ != before_;
            for (const bool ready : {true, false})
                body(call, ready, name + (ready ? "" : ", stale") + ": ");
        }
        EXPECT_TRUE(changing >= 11 || std::getenv("TAVO_CALL")) << changing;
    }

    bool IsRefused() const { return outcome_->report.failed || outcome_->report.code != clean_.code; }

    // A success is whole, at once or after the next change; a failure has changed nothing, and nothing follows from it. An
    // entry that failed by itself leaves its code beside the 0 of its batch.
    void ExpectOldOrNew(const std::string &where)
    {
        const bool failed = outcome_->report.failed;
        const int code = outcome_->report.code;
        SCOPED_TRACE(where + (failed ? " failed, code " : " code ") + Hex(code));
        EXPECT_TRUE(!failed || code != 0) << "a failure without a reason";
        const bool undecided = failed && code == ERR_RENAME_FAILED;
        EXPECT_TRUE(!failed || undecided || !MarkerIsThere()) << "a failure that the next change completes";
        EXPECT_EQ(test::NextChange(), 0);
        Files found = test::Everything();
        const bool done = !failed || code == ERR_UNLOCK_FAILED;  // that comes when all is done
        const auto is_new = [&](const char *path) {
            return found.at(path) == after_.at(path);
        };
        if (done && is_new("/etc/passwd") && is_new("/etc/shadow")) {
            ForgivePasswords(found);
            if (outcome_->logged_home)
                ForgiveHomes(found);
        }
        if (!IsRefused() || code == ERR_UNLOCK_FAILED) {
            EXPECT_EQ(test::Difference(found, after_), "");
            EXPECT_TRUE(failed || !std::strcmp(outcome_->report.text, clean_.text)) << outcome_->report.text;
        } else if (!failed || undecided) {
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
        if (const size_t at = text.find("robert:secret"); at != text.npos)
            text.replace(at, 6, "bob");
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
    Report clean_ = {};
    Outcome *outcome_ = nullptr;
};

// A folder at that path, for as long as it lives.
class Blocked {
  public:
    explicit Blocked(std::string path) : path_(std::move(path))
    {
        std::filesystem::create_directories(std::filesystem::path(path_).parent_path());
        if (::access(path_.c_str(), F_OK) == 0)
            std::filesystem::rename(path_, path_ + ".away");
        std::filesystem::create_directories(path_ + "/in");
        std::filesystem::permissions(path_, std::filesystem::perms(0700));
    }
    ~Blocked()
    {
        std::filesystem::remove_all(path_);
        if (::access((path_ + ".away").c_str(), F_OK) == 0)
            std::filesystem::rename(path_ + ".away", path_);
    }
    Blocked(const Blocked &) = delete;
    Blocked &operator=(const Blocked &) = delete;

  private:
    const std::string path_;
};

// What each call says otherwise when one thing of the appliance is broken, or when its caller has no rights. A failure has
// changed nothing.
TEST_F(Faults, EachCallSaysWhatIsBroken)
{
    if (!test::CanBecomeNobody())
        GTEST_SKIP() << "only one user id is mapped here";
    const struct {
        const char *what;
        std::vector<const char *> blocked;
        std::vector<std::array<const char *, 3>> entries;  // of the stores: key and value
        bool is_nobody = false;
    } rows[] = {
        {"without rights", {}, {}, true},
        {"without rights, and no files", {"/etc/passwd", "/etc/group"}, {}, true},
        {"no locks", {"/tmp/lock/lock_pw", "/tmp/lock/lock_gr"}, {}},
        {"no lock of the system", {"/etc/.pwd.lock"}, {}},
        {"no files", {"/etc/passwd", "/etc/group"}, {}},
        {"no settings", {"/etc.defaults/tavoinfo.conf"}, {}},
        {"no room for new files", {"/etc/shadow.tmp", "/etc/group_tmp"}, {}},
        {"no marker", {"/etc/.tavoaccount.commit"}, {}},
        {"names", {}, {{TAVO_USER_DB_NAME, "ALICE", "alice"}, {TAVO_GROUP_DB_NAME, "STAFF", "staff"}}},
        {"other stores", {}, {{TAVO_USER_DB_SHADOW, "ALICE", "alice"}, {TAVO_GROUP_DB_DESC, "STAFF", "staff"}}},
        {"mail", {}, {{TAVO_USER_DB_MISC, "ALICE", "alice"}, {TAVO_GROUP_DB_DESC, "STAFF", "staff:a\nb"}}},
        {"Samba", {}, {{TAVO_USER_DB_SMB, "ALICE", "alice"}, {TAVO_USER_DB_UID, "001025", "NONE"}}},
    };
    test::CapturedLog log;
    test::Story story{TEST_GOLDEN, {test::LogOf(log, LOG_NOTICE)}};
    story.Mask("0x4000, errno=[0-9]+", "0x4000, errno=...");  // no call of the system's failed
    const std::regex pure(
        "TAVO(BDb|Unit|User(Alloc|Free|Exp|Is|Rand|Remove)|Group(Alloc|Free)|.*Quota(Init|Off|Fmt)).*");
    for (const auto &row : rows) {
        story.Head(row.what);
        for (const Call &call : every_call::AccountFamily().calls) {
            if (call.name[0] != 'T' || std::regex_match(call.name, pure))
                continue;
            const auto make = [&](bool broken) {
                ForgetStores();
                Begin(true);
                for (const auto &[store, key, value] : row.entries)
                    if (broken)
                        test::PutEntry(store, key, value);
                std::vector<std::unique_ptr<Blocked>> blocked;
                for (const char *path : row.blocked)
                    if (broken)
                        blocked.push_back(std::make_unique<Blocked>(path));
                if (!broken || !row.is_nobody) {
                    Make(call, Trial::Watch::nothing);
                } else {
                    test::AsNobody([&] { return Make(call, Trial::Watch::nothing), ""; });
                    TLIBErrSetEx(outcome_->report.code, "nobody", 0);
                }
                return outcome_->report;
            };
            const Report clean = make(false);
            const Report report = make(true);
            if (report.failed == clean.failed && report.code == clean.code && !std::strcmp(report.text, clean.text))
                continue;
            story.Tell(call.name, [&] { return make(true).failed ? -1 : 0; });
            if (report.failed)
                EXPECT_EQ(test::Difference(test::Everything(), before_), "") << row.what << ": " << call.name;
            else
                story.Show("answer", report.text);
        }
    }
}

TEST_F(Faults, EveryAllocation)
{
    OfEachCall([&](const Call &call, bool ready, const std::string &which) {
        Sample sample(call, ready);
        for (int n = 1;; n += sample.Step(after_ != before_ ? 60 : 12)) {
            ASSERT_NO_FATAL_FAILURE(Begin(ready));
            const pid_t child = ::fork();
            if (child == 0) {
                Make(call, Trial::Watch::allocations, n);
                ::_exit(0);
            }
            int status = 0;
            ::waitpid(child, &status, 0);
            const std::string where = which + "allocation " + std::to_string(n);
            EXPECT_EQ(status, 0) << where;
            if (status != 0)
                continue;
            const Report &report = outcome_->report;
            if (!report.fired)
                break;
            EXPECT_LE(report.live, 0) << where << " left allocated";
            // A deleted user's home that stays for now has a code of its own.
            if (report.failed || report.code != ERR_REMOVE_FAILED) {
                EXPECT_EQ(Hex(report.code), Hex(IsRefused() ? ERR_OUT_OF_MEMORY : clean_.code)) << where;
            }
            ExpectOldOrNew(where);
        }
    });
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
    OfEachCall([&](const Call &call, bool ready, const std::string &which) {
        const std::function<void()> work = [&] {
            const test::CapturedLog log;
            Make(call, Trial::Watch::system_calls);
            for (const std::string &line : log.Texts())
                outcome_->logged_home |= line.find("look for the home folder") != line.npos;
        };
        ASSERT_NO_FATAL_FAILURE(Begin(ready));
        std::vector<test::SystemCall> calls = test::SystemCallsOf(work);
        if (Long())
            std::erase_if(calls, [](const test::SystemCall &each) { return !test::CanFail(each); });
        else
            calls = test::DistinctCalls(calls);
        Sample sample(call, ready);
        for (size_t pair = 0; pair < calls.size() * std::size(kErrors);
             pair += static_cast<size_t>(sample.Step(after_ != before_ ? 60 : 15))) {
            const test::SystemCall &failing = calls[pair / std::size(kErrors)];
            const int error = kErrors[pair % std::size(kErrors)];
            ASSERT_NO_FATAL_FAILURE(Begin(ready));
            const test::Ending ending = test::FailsAtCall(failing, error, work);
            const Report &report = outcome_->report;
            const std::string where =
                which + failing.Name() + " " + std::to_string(failing.index) + ", " + ::strerrorname_np(error);
            EXPECT_TRUE(ending.IsClean() && report.done) << where << " " << ending;
            if (!report.done)
                continue;
            EXPECT_FALSE(IsAboutAccounts(report.code)) << where << " code " << Hex(report.code);
            const std::set<std::string> writes{"write", "pwrite64", "fsync", "fdatasync"};
            if (error == ENOSPC && report.failed && writes.contains(failing.Name())) {
                EXPECT_EQ(Hex(report.code), Hex(ERR_NOT_ENOUGH_SPACE)) << where;
            }
            ExpectOldOrNew(where);
        }
    });
}

}  // namespace
