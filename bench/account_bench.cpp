// Adding users in batches, and setting hashes that are there already, against Debian's own tools; and how long a user with
// a large home folder keeps others waiting while it is deleted.
// Changes the accounts of the root that it runs in.
#include "tavo_user.h"

#include "compare.h"

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

constexpr int kThere = 1000;
constexpr int kAdded = 1000;
constexpr int kSample = 20;  // where each takes as long as the next, fewer are enough
constexpr char hash[] = "$1$ab$cdefghijklmnopqrstuv./";
const char *const files[] = {"/etc/passwd", "/etc/shadow", "/etc/group", "/etc/tavouser.conf",
                             "/usr/tavo/etc/private/smbpasswd"};

[[noreturn]] void GiveUp(const std::string &reason)
{
    std::fprintf(stderr, "account_bench: %s\n", reason.c_str());
    std::exit(1);
}

std::string Text(const char *path)
{
    std::ifstream in(path);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

std::vector<std::string> saved;

void Save()
{
    saved.clear();
    for (const char *path : files)
        saved.push_back(Text(path));
}

// The files as they were, and stores that fit to them.
void Restore()
{
    for (std::size_t i = 0; i < std::size(files); ++i)
        std::ofstream(files[i]) << saved[i];
    TAVOUSER *user = nullptr;
    if (TAVOUserGet("root", &user) != 0)
        GiveUp("there is no root");
    TAVOUserFree(user);
    ::sync();
}

struct Batch {
    Batch(int first, int count)
    {
        for (int i = first; i < first + count; ++i)
            names.push_back("user" + std::to_string(i));
        for (const std::string &name : names) {
            TAVOUSER user = {};
            user.szName = const_cast<char *>(name.c_str());
            user.szPasswd = const_cast<char *>("a password of some length");
            user.nUid = user.nGid = user.nExpired = -1;
            users.push_back(user);
        }
        for (const TAVOUSER &user : users) {
            records.push_back(&user);
            old_names.push_back(nullptr);
            hashes.push_back(hash);
            samba.push_back("0123456789ABCDEF0123456789ABCDEF");
        }
    }
    void Add() const
    {
        if (TAVOUserSet(old_names.data(), records.data(), static_cast<int>(records.size())) != 0)
            GiveUp("the users cannot be added");
    }
    void SetHashes() const
    {
        const int count = static_cast<int>(records.size());
        if (TAVOUserSetPasswd(records.data(), hashes.data(), samba.data(), samba.data(), count) != 0)
            GiveUp("the hashes cannot be set");
    }
    std::vector<std::string> names;
    std::vector<TAVOUSER> users;
    std::vector<const TAVOUSER *> records;
    std::vector<const char *> old_names, hashes, samba;
};

void Run(const std::string &command)
{
    if (std::system(command.c_str()) != 0)
        GiveUp("this fails: " + command);
}

// Each round starts from the same accounts; only the work itself counts, times `share` of the whole of it.
void Measure(const std::string &name, double share, const std::function<void()> &work)
{
    benchmark::RegisterBenchmark(
        name.c_str(),
        [=](benchmark::State &state) {
            for ([[maybe_unused]] auto round : state) {
                Restore();
                const auto begin = std::chrono::steady_clock::now();
                work();
                state.SetIterationTime(std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count() *
                                       share);
            }
        })
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond);
}

// The seconds from the call to the moment at which another process gets the lock of the accounts.
double HeldWhileDeleted(const fs::path &home)
{
    const std::string name = home.filename();
    const int lock = ::open("/tmp/lock/lock_pw", O_RDONLY | O_CLOEXEC);
    if (lock < 0)
        GiveUp("there is no lock");
    const auto begin = std::chrono::steady_clock::now();
    const pid_t child = ::fork();
    if (child == 0) {
        const char *const names[] = {name.c_str()};
        ::_exit(TAVOUserDelete(names, 1) == 0 ? 0 : 1);
    }
    // The folder is put aside under the lock.
    siginfo_t ended = {};
    while (fs::exists(home) && ::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 &&
           ended.si_pid == 0)
        ::usleep(100);
    ::flock(lock, LOCK_EX);
    const double held = std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
    ::close(lock);
    int status = 0;
    if (::waitpid(child, &status, 0) != child || status != 0)
        GiveUp("the user cannot be deleted");
    return held;
}

// How long the locks are held, in a row of its own: what takes long comes after them.
void MeasureLargeHome()
{
    constexpr int file_count = 150000;
    benchmark::RegisterBenchmark(("locks_held_deleting_home/" + std::to_string(file_count) + "/tavo").c_str(),
                                 [](benchmark::State &state) {
                                     for ([[maybe_unused]] auto round : state) {
                                         Restore();
                                         Batch(kThere, 1).Add();
                                         const fs::path home = "/volume1/homes/user" + std::to_string(kThere);
                                         fs::create_directories(home);
                                         for (int i = 0; i < file_count; ++i)
                                             std::fclose(std::fopen((home / std::to_string(i)).c_str(), "w"));
                                         state.SetIterationTime(HeldWhileDeleted(home));
                                         if (fs::exists(home))
                                             GiveUp("the home is still there");
                                     }
                                 })
        ->UseManualTime()
        ->Iterations(1)
        ->Unit(benchmark::kMillisecond);
}

void WriteLists()
{
    std::ofstream clear("/tmp/newusers");
    for (int i = kThere; i < kThere + kSample; ++i)
        clear << "user" << i << ":a password of some length:" << 1100 + i << ":100::/var/services/homes/user" << i
              << ":/bin/csh\n";
}

}  // namespace

int main(int argc, char **argv)
{
    if (!std::getenv("TAVO_ROOT_FORM"))
        GiveUp("run me in an appliance root: tools/appliance/enter");
    Batch(0, kThere).Add();
    Save();
    WriteLists();
    const Batch batch(kThere, kAdded);
    const std::string size = "/" + std::to_string(kAdded) + "/";

    Measure("add_users_hashed" + size + "tavo", 1, [&] { batch.Add(); });
    if (fs::exists("/usr/sbin/newusers"))
        Measure("add_users_hashed" + size + "newusers", double{kAdded} / kSample,
                [] { Run("/usr/sbin/newusers /tmp/newusers 2>/dev/null"); });
    // Hashes that are there already: what is left is the files.
    Measure("set_hashes" + size + "tavo", 1, [&] { Batch(0, kThere).SetHashes(); });
    if (fs::exists("/usr/sbin/chpasswd")) {
        std::ofstream list("/tmp/chpasswd");
        for (int i = 0; i < kThere; ++i)
            list << "user" << i << ":" << hash << "\n";
        list.close();
        Measure("set_hashes" + size + "chpasswd", 1, [] { Run("/usr/sbin/chpasswd -e </tmp/chpasswd"); });
    }
    Measure("add_users_singly" + size + "tavo", double{kAdded} / kSample, [] {
        for (int i = 0; i < kSample; ++i)
            Batch(kThere + i, 1).Add();
    });
    if (fs::exists("/usr/sbin/useradd"))
        Measure("add_users_hashed" + size + "useradd", double{kAdded} / kSample, [] {
            for (int i = kThere; i < kThere + kSample; ++i)
                Run("/usr/sbin/useradd -M -N -g 100 -p '" + std::string(hash) + "' user" + std::to_string(i));
        });

    std::ofstream("/usr/tavo/etc/share.conf") << "[homes]\npath=/volume1/homes\n";
    MeasureLargeHome();

    return bench::Run(argc, argv);
}
