// Samba's own tools change their password file while the library carries batches through. Whatever a tool has reported as done
// is there, and stays.
#include "tavo_user.h"

#include "machine_users.h"
#include "support/machine.h"
#include "support/rounds.h"
#include "support/scratch_dir.h"

#include <algorithm>
#include <atomic>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include <signal.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

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
    std::vector<TAVOUSER> users(names.size());
    std::vector<const TAVOUSER *> records;
    for (size_t i = 0; i < names.size(); ++i) {
        users[i].szName = const_cast<char *>(names[i].c_str());
        users[i].szPasswd = const_cast<char *>("x");
        users[i].nUid = users[i].nGid = users[i].nExpired = -1;
        records.push_back(&users[i]);
    }
    const std::vector<const char *> none(names.size());
    TLIBErrSet(ERR_SUCCESS);
    const int result = TAVOUserSet(none.data(), records.data(), static_cast<int>(names.size()));
    return result == 0 ? TLIBErrGet() : -1;
}

[[noreturn]] void CarryBatches(Score &score)
{
    for (int round = 0;; ++round) {
        std::vector<std::string> names;
        std::vector<const char *> doomed;
        for (int i = 0; i < kBatch; ++i)
            names.push_back("passing" + std::to_string(round % 7) + "_" + std::to_string(i));
        for (const std::string &name : names)
            doomed.push_back(name.c_str());
        score.failed += Add(names) != 0;
        score.failed += TAVOUserDelete(doomed.data(), kBatch) != 0;
        score.batches += 2;
    }
}

struct Account {
    std::string nt_hash;
    bool disabled = false;

    bool operator==(const Account &) const = default;
};

// What Samba's file says of the users whom the tools change.
std::map<std::string, Account> Stored()
{
    std::map<std::string, Account> found;
    std::istringstream lines(test::ReadFile(kFile));
    for (std::string line; std::getline(lines, line);) {
        std::istringstream fields(line);
        std::string name, uid, lm, nt, flags;
        for (std::string *field : {&name, &uid, &lm, &nt, &flags})
            std::getline(fields, *field, ':');
        if (name.starts_with("kept"))
            found[name] = {nt, flags.find('D') != flags.npos};
    }
    return found;
}

// What the tools have reported.
class Tools {
  public:
    explicit Tools(std::map<std::string, Account> start) : reported_(std::move(start)) {}

    int Changes() const { return changes_; }
    const std::map<std::string, Account> &Reported() const { return reported_; }

    // A tool may find the file locked for too long and say so: then it has reported nothing.
    void SetPassword(const std::string &name, const std::string &password)
    {
        unsigned char hash[16];
        ASSERT_EQ(TLIBSmbMd4Hash(password.c_str(), hash), 0);
        if (test::Shell("printf '" + password + "\\n" + password + "\\n' | smbpasswd -c " + kConf + " -s " + name)
                .status != 0)
            return;
        reported_[name].nt_hash = test::Hex(hash);
        reported_[name].disabled = false;
        ++changes_;
    }
    void Disable(const std::string &name, bool disabled)
    {
        if (test::Shell(std::string("smbpasswd -c ") + kConf + (disabled ? " -d " : " -e ") + name).status != 0)
            return;
        reported_[name].disabled = disabled;
        ++changes_;
    }
    void SetFlags(const std::string &name, bool disabled)
    {
        if (test::Shell(std::string("pdbedit -s ") + kConf + " -r -c '[" + (disabled ? "D" : "") + "]' " + name)
                .status != 0)
            return;
        reported_[name].disabled = disabled;
        ++changes_;
    }
    // One tool that changes every user, each by a change of the file of its own.
    void Import(int round)
    {
        std::string text = test::ReadFile(kFile);
        std::map<std::string, Account> wanted = reported_;
        std::string list;
        std::istringstream lines(text);
        for (std::string line; std::getline(lines, line);) {
            if (!line.starts_with("kept"))
                continue;
            const std::string name = line.substr(0, line.find(':'));
            char hash[33];
            std::snprintf(hash, sizeof hash, "%032X", 1000 * round + changes_);
            size_t at = 0;
            for (int field = 0; field < 3; ++field)
                at = line.find(':', at) + 1;
            list += line.replace(at, 32, hash) + "\n";
            wanted[name].nt_hash = hash;
            wanted[name].disabled = line.substr(line.find('['), line.find(']') - line.find('[')).find('D') != line.npos;
        }
        test::WriteFile(kImported, list, 0600);
        const test::CommandResult done =
            test::Shell(std::string("pdbedit -s ") + kConf + " -i smbpasswd:" + kImported + " -e smbpasswd:" + kFile);
        ASSERT_EQ(done.status, 0) << done.output;
        reported_ = wanted;
        changes_ += static_cast<int>(wanted.size());
    }

  private:
    std::map<std::string, Account> reported_;
    int changes_ = 0;
};

std::string Lost(const std::map<std::string, Account> &found, const std::map<std::string, Account> &reported)
{
    std::string text;
    for (const auto &[name, account] : reported) {
        const auto now = found.find(name);
        if (now == found.end() || !(now->second == account))
            text += name + " was reported as " + account.nt_hash + (account.disabled ? " D" : "") + ", and is " +
                    (now == found.end() ? "gone" : now->second.nt_hash + (now->second.disabled ? " D" : "")) + "\n";
    }
    return text;
}

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
        switch (round % 5) {
        case 0:
            tools.SetPassword(name, "secret " + std::to_string(round));
            break;
        case 1:
            tools.Disable(name, true);
            break;
        case 2:
            tools.SetFlags(name, round % 2 == 0);
            break;
        case 3:
            tools.Disable(name, false);
            break;
        default:
            tools.Import(round);
            break;
        }
        ++runs;
        ASSERT_LT(runs, wanted) << "the tools do not get through";
        EXPECT_EQ(Lost(Stored(), tools.Reported()), "") << "after run " << runs;
    }
    ::kill(library, SIGKILL);
    ::waitpid(library, nullptr, 0);
    EXPECT_EQ(score->failed, 0);
    EXPECT_GT(score->batches, runs / 20);
    ASSERT_EQ(Add({"last"}), 0);
    EXPECT_EQ(Lost(Stored(), tools.Reported()), "");
    RecordProperty("changes", tools.Changes());
    RecordProperty("runs", runs);
    RecordProperty("batches", score->batches);
    std::fprintf(stderr, "%d changes by %d runs of Samba's tools, %d batches\n", tools.Changes(), runs,
                 score->batches.load());
}

}  // namespace
