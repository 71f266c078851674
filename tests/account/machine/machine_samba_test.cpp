// Samba's own tools change their password file while the library carries batches through. Whatever a tool has reported as done
// is there, and stays.
#include "tavo_user.h"

#include "account/user/user_fixture.h"
#include "support/machine.h"
#include "support/rounds.h"
#include "support/test.h"

#include <atomic>

#include <sys/mman.h>

namespace {

constexpr int kUsers = 40;  // whom the tools change
constexpr int kBatch = 20;  // users that come and go meanwhile
constexpr char kFile[] = "/usr/tavo/etc/private/smbpasswd";
constexpr char kImported[] = "/root/imported";
constexpr char kConf[] = "/root/smb.conf";

// What the other process has done, in memory that both share.
struct Score {
    std::atomic<int> batches;
    std::atomic<int> failed;
};

std::string NameOf(int number)
{
    return "kept" + std::to_string(number);
}

int Add(const std::vector<std::string> &names)
{
    test::Changes changes;
    for (const std::string &name : names)
        changes.emplace_back("", name);
    return test::SetUsers(changes, "x");
}

[[noreturn]] void CarryBatches(Score &score)
{
    for (int round = 0;; ++round) {
        std::vector<std::string> names;
        for (int i = 0; i < kBatch; ++i)
            names.push_back("passing" + std::to_string(round % 7) + "_" + std::to_string(i));
        score.failed += Add(names) != 0;
        score.failed += test::DeleteUsers(names) != 0;
        score.batches += 2;
    }
}

// The hashes of the users whom the tools change, with a "D" for a disabled one.
using Accounts = std::map<std::string, std::string>;

// What Samba's file says of them.
Accounts Stored()
{
    Accounts found;
    for (const std::string &line : test::Lines(test::ReadFile(kFile))) {
        std::istringstream fields(line);
        std::string name, uid, lm, nt, flags;
        for (std::string *field : {&name, &uid, &lm, &nt, &flags})
            std::getline(fields, *field, ':');
        if (name.starts_with("kept"))
            found[name] = nt + (flags.find('D') == flags.npos ? "" : " D");
    }
    return found;
}

// What the tools have reported.
class Tools {
  public:
    explicit Tools(Accounts start) : reported_(std::move(start)) {}

    int Changes() const { return changes_; }
    const Accounts &Reported() const { return reported_; }

    // A tool may find the file locked for too long and say so: then it has reported nothing.
    void SetPassword(const std::string &name, const std::string &password)
    {
        unsigned char hash[16];
        ASSERT_EQ(TLIBSmbMd4Hash(password.c_str(), hash), 0);
        if (test::Shell("printf '" + password + "\\n" + password + "\\n' | LC_ALL=C.UTF-8 smbpasswd -c " + kConf +
                        " -s " + name)
                .status != 0)
            return;
        reported_[name] = test::Hex(hash);
        ++changes_;
    }
    void Disable(const std::string &name, bool disabled, bool by_pdbedit)
    {
        const std::string tool = by_pdbedit
                                     ? std::string("pdbedit -s ") + kConf + " -r -c '[" + (disabled ? "D" : "") + "]' "
                                     : std::string("smbpasswd -c ") + kConf + (disabled ? " -d " : " -e ");
        if (test::Shell(tool + name).status != 0)
            return;
        reported_[name] = reported_[name].substr(0, 32) + (disabled ? " D" : "");
        ++changes_;
    }
    // One tool that changes every user, each by a change of the file of its own.
    void Import(int round)
    {
        Accounts wanted = reported_;
        std::string list;
        for (std::string line : test::Lines(test::ReadFile(kFile))) {
            if (!line.starts_with("kept"))
                continue;
            char hash[33];
            std::snprintf(hash, sizeof hash, "%032X", 1000 * round + changes_);
            size_t at = 0;
            for (int field = 0; field < 3; ++field)
                at = line.find(':', at) + 1;
            list += line.replace(at, 32, hash) + "\n";
            wanted[line.substr(0, line.find(':'))].replace(0, 32, hash);
        }
        test::WriteFile(kImported, list, 0600);
        const test::CommandResult done =
            test::Shell(std::string("pdbedit -s ") + kConf + " -i smbpasswd:" + kImported + " -e smbpasswd:" + kFile);
        ASSERT_EQ(done.status, 0) << done.output;
        reported_ = wanted;
        changes_ += static_cast<int>(wanted.size());
    }

  private:
    Accounts reported_;
    int changes_ = 0;
};

using MachineSamba = test::MachineTest;

TEST_F(MachineSamba, WhatItsToolsReportStaysWhileBatchesRun)
{
    test::WriteFile(kConf, "[global]\npassdb backend = smbpasswd:" + std::string(kFile) +
                               "\nprivate dir = /root\nlock directory = /root\nstate directory = /root\n"
                               "cache directory = /root\npid directory = /root\n");
    std::vector<std::string> names;
    for (int i = 0; i < kUsers; ++i)
        names.push_back(NameOf(i));
    ASSERT_EQ(Add(names), 0);
    Tools tools(Stored());
    auto *score =
        static_cast<Score *>(::mmap(nullptr, sizeof(Score), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(score, MAP_FAILED);
    const pid_t library = ::fork();
    if (library == 0)
        CarryBatches(*score);
    const int wanted = std::max(test::Rounds(2000), 60);
    int runs = 0;
    for (int round = 0; tools.Changes() < wanted && !HasFailure(); ++round) {
        const std::string name = NameOf(round % kUsers);
        if (round % 5 == 0)
            tools.SetPassword(name, "gr\xC3\xBC\xC3\x9F, number " + std::to_string(round));
        else if (round % 5 == 4)
            tools.Import(round);
        else
            tools.Disable(name, round % 5 == 1 || round % 10 == 2, round % 5 == 2);
        ++runs;
        ASSERT_LT(runs, wanted) << "the tools do not get through";
        EXPECT_EQ(Stored(), tools.Reported()) << "after run " << runs;
    }
    ::kill(library, SIGKILL);
    ::waitpid(library, nullptr, 0);
    EXPECT_EQ(score->failed, 0);
    EXPECT_GT(score->batches, runs / 20);
    ASSERT_EQ(Add({"last"}), 0);
    EXPECT_EQ(Stored(), tools.Reported());
    RecordProperty("changes", tools.Changes());
    RecordProperty("runs", runs);
    RecordProperty("batches", score->batches);
    std::fprintf(stderr, "%d changes by %d runs of Samba's tools, %d batches\n", tools.Changes(), runs,
                 score->batches.load());
}

}  // namespace
