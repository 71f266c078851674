// Calls every exported function once. Then each of its system calls fails, with each of the errors of a worn disk, a
// full one, another user's file, a busy process and a signal; then each of its allocations. Whatever fails, the process
// lives, no file is half written, and the caller learns the truth.
#include "call.h"
#include "support/descriptors.h"
#include "support/failing_malloc.h"
#include "support/file_snapshot.h"
#include "support/rounds.h"
#include "support/test.h"
#include "support/text_lines.h"
#include "support/traced_call.h"

#include <sys/mman.h>

using every_call::Call;
using every_call::Report;
using every_call::Trial;
using test::KeptFiles;

namespace every_call {
void LoadAnswers();
}

namespace {

Report *dying_report = nullptr;

constexpr int kErrors[] = {EIO, ENOSPC, EACCES, EMFILE, EINTR};

constexpr size_t kMany = 25;  // places in one call

// The codes of the core and the accounts for it: without memory a stream cannot be read or written, a file cannot be
// opened, and a store not be closed.
const auto kNoMemory =
    testing::AnyOf(ERR_OUT_OF_MEMORY, ERR_OPEN_FAILED, ERR_READ_FAILED, ERR_WRITE_FAILED, ERR_DB_CLOSE);

// A change of the accounts makes system calls from hundreds of places and takes long: of more than so many, a part is
// tried in turn.
constexpr size_t kTried = 60;

size_t Step(size_t places)
{
    const size_t step = static_cast<size_t>(test::Stride());
    return std::getenv("TAVO_LONG_TESTS") ? 1 : step * (1 + places / kTried);
}

constexpr const char *kExported =
#include "exported_names.h"
    ;

std::vector<every_call::Family> Families()
{
    return {every_call::CoreFamily(), every_call::StorageFamily(), every_call::AccountFamily(),
            every_call::NetworkFamily(), every_call::ServiceFamily()};
}

TEST(EveryCall, EveryExportedNameIsInTheTable)
{
    std::set<std::string> called;
    for (const every_call::Family &family : Families()) {
        for (const Call &call : family.calls)
            called.insert(call.name);
    }
    // The names of a version script: lines with one name and a semicolon.
    std::set<std::string> exported;
    for (const std::string &line : test::Lines(kExported)) {
        char name[64], end = 0;
        if (std::sscanf(line.c_str(), " %63[A-Za-z0-9_]%c", name, &end) == 2 && end == ';')
            exported.insert(name);
    }
    ASSERT_GT(exported.size(), 400u);
    for (const std::string &name : exported)
        EXPECT_TRUE(called.contains(name)) << name << " is exported and in no table of calls";
    for (const std::string &name : called)
        EXPECT_TRUE(exported.contains(name)) << name << " is in a table of calls and not exported";
}

constexpr char kJournal[] = "/etc/.tavoaccount.commit";

// May appear or disappear with any call: locks, the caches that are rebuilt from the files, and the journals from which
// the next program finishes a change.
bool IsPassing(const std::string &path)
{
    for (const std::string_view place : {"/tmp/lock", "/tmp/.db.", kJournal, "/etc/network.undo", "/etc/.pwd.lock"}) {
        if (path.starts_with(place))
            return true;
    }
    return false;
}

std::string NameOf(const testing::TestParamInfo<every_call::Family> &family)
{
    return family.param.name;
}

class EveryCall : public testing::TestWithParam<every_call::Family> {
  protected:
    void SetUp() override
    {
        if (test::RootForm().empty())
            GTEST_SKIP() << "only in an appliance root";
        every_call::LoadAnswers();
        kept_ = GetParam().prepare();
        if (testing::Test::IsSkipped() || testing::Test::HasFatalFailure())
            return;
        void *const shared = ::mmap(nullptr, sizeof(Report), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
        ASSERT_NE(shared, MAP_FAILED);
        report_ = static_cast<Report *>(shared);
    }

    void TearDown() override
    {
        if (report_)
            ::munmap(report_, sizeof *report_);
    }

    // TAVO_CALL=NAME in the environment of the program selects one function.
    static bool IsChosen(const Call &call)
    {
        const char *const chosen = std::getenv("TAVO_CALL");
        return !chosen || std::string_view(chosen) == call.name;
    }

    static bool IsOnStack(const std::vector<uintptr_t> &stack, std::string_view object)
    {
        std::ifstream maps("/proc/self/maps");
        for (std::string line; std::getline(maps, line);) {
            unsigned long begin = 0;
            unsigned long end = 0;
            char modes[8] = "";
            if (line.find(object) == line.npos || std::sscanf(line.c_str(), "%lx-%lx %7s", &begin, &end, modes) != 3 ||
                modes[2] != 'x')
                continue;
            if (std::any_of(stack.begin(), stack.end(), [&](uintptr_t word) { return word >= begin && word < end; }))
                return true;
        }
        return false;
    }

    static void Silence()
    {
        const int nowhere = ::open("/dev/null", O_RDWR);
        ::dup2(nowhere, STDOUT_FILENO);
        ::dup2(nowhere, STDERR_FILENO);
        ::close(nowhere);
    }

    // The body of a child: makes the call and counts what it leaves open.
    void Make(const Call &call, Trial::Watch watch, int failing_allocation = 0)
    {
        Silence();
        {
            Trial run(*report_, watch, failing_allocation);
            if (call.flags & every_call::kZeroFails)
                run.ZeroFails();
            call.body(run);
        }
        report_->descriptors = test::OpenDescriptors();
    }

    // In a child that is not traced.
    Report MakeInChild(const Call &call, Trial::Watch watch, int failing_allocation, int &status)
    {
        *report_ = {};
        const pid_t child = ::fork();
        if (child == 0) {
            ::alarm(30);
            dying_report = report_;
            ::signal(SIGSEGV, [](int signal) {
                dying_report->database = test::FailedInside("libdb");
                ::signal(signal, SIG_DFL);
                ::raise(signal);
            });
            Make(call, watch, failing_allocation);
            ::syscall(SYS_exit_group, 0);
        }
        ::waitpid(child, &status, 0);
        return *report_;
    }

    // Compares the outcome of a call with a failed step with the outcome of a healthy one.
    static void Judge(const Call &call, const Report &clean, const Report &got)
    {
        const bool same = std::strcmp(clean.text, got.text) == 0;
        if (got.failed && !clean.failed) {
            EXPECT_TRUE(got.code != ERR_SUCCESS || (call.flags & every_call::kNoCode)) << "a failure without a code";
        } else if (!(call.flags & every_call::kAnswers)) {
            EXPECT_TRUE(same) << "\"" << got.text << "\" instead of \"" << clean.text << "\", code " << std::hex
                              << got.code;
            EXPECT_TRUE(got.code == clean.code || (call.flags & every_call::kLeavesCode))
                << "a success that leaves code " << std::hex << got.code;
        }
    }

    // A text without the parts that differ at each writing: the salts and dates of passwords.
    static std::string Comparable(const std::string &path, const std::string &content)
    {
        if (!path.ends_with("/shadow") && !path.ends_with("/smbpasswd"))
            return content;
        std::string names;
        for (size_t at = 0; at < content.size();) {
            const size_t end = std::min(content.find('\n', at), content.size());
            names += content.substr(at, std::min(content.find(':', at), end) - at) + "\n";
            at = end + 1;
        }
        return names;
    }

    static bool IsIn(const KeptFiles &files, const std::string &path, const test::KeptFile &file)
    {
        const auto found = files.find(path);
        return found != files.end() && (found->second.facts.st_mode & S_IFMT) == (file.facts.st_mode & S_IFMT) &&
               Comparable(path, found->second.content) == Comparable(path, file.content);
    }

    // Files are as before or as after the change, and no other file has appeared.
    static void JudgeFiles(const Call &call, const KeptFiles &before, const KeptFiles &after, const KeptFiles &found,
                           bool may_leave)
    {
        if (call.flags & every_call::kSteps)
            return;
        for (const auto &[path, file] : found) {
            if (IsPassing(path))
                continue;
            // The next program moves the files that a remaining journal names into place.
            if ((path.ends_with(".tmp") || path.ends_with("_tmp")) && found.contains(kJournal))
                continue;
            if (!before.contains(path) && !after.contains(path)) {
                EXPECT_TRUE(may_leave) << path << " is left";
                continue;
            }
            const bool created = (call.flags & every_call::kCreates) && !before.contains(path) && file.content.empty();
            EXPECT_TRUE(created || IsIn(before, path, file) || IsIn(after, path, file)) << path << " is half written:\n"
                                                                                        << file.content.substr(0, 2000);
        }
        for (const auto &[path, file] : before) {
            EXPECT_TRUE(IsPassing(path) || !after.contains(path) || found.contains(path)) << path << " is gone";
        }
    }

    std::shared_ptr<void> kept_;
    Report *report_ = nullptr;
};

// In this process, where a memory checker sees it.
TEST_P(EveryCall, Once)
{
    test::FileSnapshot files(GetParam().folders);
    for (const Call &call : GetParam().calls) {
        SCOPED_TRACE(call.name);
        int status = 0;
        if (call.flags & every_call::kInChild) {
            MakeInChild(call, Trial::Watch::nothing, 0, status);
            EXPECT_EQ(status, 0);
        } else {
            *report_ = {};
            Trial run(*report_, Trial::Watch::nothing, 0);
            if (call.flags & every_call::kZeroFails)
                run.ZeroFails();
            call.body(run);
        }
        EXPECT_TRUE(!report_->failed || (call.flags & every_call::kAnswers))
            << report_->text << ", code " << std::hex << report_->code << " from "
            << (TAVOErrorGetFile() ? TAVOErrorGetFile() : "");
        files.Restore();
    }
}

TEST_P(EveryCall, EachSystemCallFails)
{
    if (!test::CanTrace())
        GTEST_SKIP() << "ptrace is refused here";
#ifdef __SANITIZE_ADDRESS__
    GTEST_SKIP() << "the sanitizer's runtime makes system calls of its own, which may not fail";
#endif
    test::FileSnapshot files(GetParam().folders);
    const KeptFiles before = files.Files();
    const int open = test::OpenDescriptors();
    int tried = 0;
    for (const Call &call : GetParam().calls) {
        if ((call.flags & every_call::kNoFaults) || !IsChosen(call))
            continue;
        const std::function<void()> work = [&] {
            Make(call, Trial::Watch::system_calls);
        };
        // Once for everything that is created on first use, such as the account stores; then to list the steps that can
        // fail.
        for (int round = 0; round < 2; ++round) {
            *report_ = {};
            test::SystemCallsOf(work);
            files.Restore();
        }
        *report_ = {};
        const auto calls = test::SystemCallsOf(work);
        const Report clean = *report_;
        EXPECT_TRUE(clean.done) << call.name;
        const KeptFiles after = files.Now();
        files.Restore();
        const auto chosen = std::getenv("TAVO_LONG_TESTS") ? calls : test::DistinctCalls(calls);
        for (size_t i = 0; i < chosen.size(); i += Step(chosen.size())) {
            if (!test::CanFail(chosen[i]))
                continue;
            for (size_t e = 0; e < std::size(kErrors); ++e) {
                if (chosen.size() > kMany && !std::getenv("TAVO_LONG_TESTS") && e != i % std::size(kErrors))
                    continue;  // of so many places each fails with one of the errors in turn
                const int error = kErrors[e];
                SCOPED_TRACE(std::string(call.name) + ": system call " + std::to_string(chosen[i].index) + " of " +
                             std::to_string(calls.back().index) + ", " + chosen[i].Name() + ", fails with " +
                             ::strerrorname_np(error));
                *report_ = {};
                const test::Ending ending = test::FailsAtCall(chosen[i], error, work);
                const Report got = *report_;
                ++tried;
                const bool database = IsOnStack(ending.stack, "libdb");
                if (database && (ending.IsClean() || WIFSIGNALED(ending.status))) {
                    // Berkeley DB leaks descriptors and memory, or dies, when the system fails it.
                    files.Restore();
                    continue;
                }
                if ((call.flags & every_call::kMayAbort) && WIFSIGNALED(ending.status) &&
                    WTERMSIG(ending.status) == SIGABRT)
                    continue;
                EXPECT_TRUE(ending.IsClean()) << ending;
                if (ending.IsClean()) {
                    Judge(call, clean, got);
                    const std::string name = chosen[i].Name();
                    const bool closes = name == "close";
                    EXPECT_TRUE(closes || (call.flags & every_call::kHolds) ||
                                got.descriptors <= std::max(open, clean.descriptors))
                        << "a descriptor is left open";
                    JudgeFiles(call, before, after, files.Now(), name.starts_with("unlink") || name == "rmdir");
                }
                files.Restore();
            }
        }
    }
    EXPECT_GT(tried, 0);
    RecordProperty("tried", tried);
}

TEST_P(EveryCall, EachAllocationFails)
{
    test::FileSnapshot files(GetParam().folders);
    const KeptFiles before = files.Files();
    for (const Call &call : GetParam().calls) {
        if ((call.flags & every_call::kNoFaults) || !IsChosen(call))
            continue;
        int status = 0;
        if (!(call.flags & every_call::kInChild)) {
            // Memory that the process keeps is allocated here, not in each child.
            *report_ = {};
            {
                Trial run(*report_, Trial::Watch::nothing, 0);
                call.body(run);
            }
            files.Restore();
        }
        const Report clean = MakeInChild(call, Trial::Watch::allocations, 0, status);
        const KeptFiles after = files.Now();
        files.Restore();
        EXPECT_EQ(status, 0) << call.name;
        EXPECT_TRUE(clean.live <= 0 || (call.flags & every_call::kHolds)) << call.name << " leaves memory allocated";
        bool fired = true;
        for (size_t n = 1; fired; n += Step(n)) {
            SCOPED_TRACE(std::string(call.name) + ": allocation " + std::to_string(n));
            const Report got = MakeInChild(call, Trial::Watch::allocations, static_cast<int>(n), status);
            fired = got.fired;
            if (got.database && WIFSIGNALED(status)) {
                fired = true;
                files.Restore();
                continue;
            }
            EXPECT_EQ(status, 0);
            if (status != 0)
                break;
            Judge(call, clean, got);
            const std::string_view family = GetParam().name;
            if ((family == "Core" || family == "Accounts") && got.failed && !clean.failed && got.code) {
                EXPECT_THAT(got.code, kNoMemory);
            }
            if (!got.database) {
                EXPECT_LE(got.live, std::max(clean.live, 0)) << "memory is left allocated";
                EXPECT_LE(got.descriptors, clean.descriptors) << "a descriptor is left open";
            }
            JudgeFiles(call, before, after, files.Now(), false);
            files.Restore();
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Of, EveryCall, testing::ValuesIn(Families()), NameOf);

}  // namespace
