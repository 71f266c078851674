// Many processes compete for one lock.
#include "tavo_lock.h"

#include "support/test.h"

#include <random>

#include <sched.h>
#include <sys/mman.h>

namespace {

constexpr int kWriters = 50;
constexpr int kReaders = 8;
constexpr int kIncrements = sizeof(void *) == 4 ? 100 : 1000;  // an emulated processor needs minutes for more

// Two counters that only agree while no process is in the middle of an increment.
struct Shared {
    volatile long first;
    volatile long second;
};

void Write(Shared &shared, int seed)
{
    for (int i = 0; i < kIncrements; ++i) {
        // Most wait in the kernel, some poll; both must exclude each other.
        while (ErrTLIBFileLock(0x400u | (i % 7 == seed % 7 ? 6u : 2u), 0) != 0)
            ::usleep(500);  // spinning would delay the holder's end
        shared.first = shared.first + 1;
        if (i % 128 == 0)
            ::sched_yield();
        shared.second = shared.second + 1;
        if (ErrTLIBFileUnlock(0x400) != 0)
            ::_exit(2);
    }
    ::_exit(0);
}

void Read(const Shared &shared)
{
    for (;;) {
        if (ErrTLIBFileLock(0x401, 0) != 0)
            ::_exit(2);
        const long first = shared.first;
        if (first != shared.second || first != shared.first)
            ::_exit(3);
        ErrTLIBFileUnlock(0x400);
        ::usleep(2000);
    }
}

void Hold()
{
    for (;;) {
        ErrTLIBFileLock(0x402, 0);
        ::usleep(300);
        ErrTLIBFileUnlock(0x400);
    }
}

template <class Body>
pid_t Start(Body body)
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        body();
        ::_exit(9);
    }
    return pid;
}

TEST(LockStorm, SumsAreExactAmongReadersAndKilledHolders)
{
    if (!std::filesystem::exists("/etc.defaults/tavoinfo.conf"))
        GTEST_SKIP() << "only in an appliance root";
    void *const memory = ::mmap(nullptr, sizeof(Shared), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    ASSERT_NE(memory, MAP_FAILED);
    Shared &shared = *static_cast<Shared *>(memory);
    std::vector<pid_t> writers, readers;
    for (int i = 0; i < kReaders; ++i)
        readers.push_back(Start([&] { Read(shared); }));
    for (int i = 0; i < kWriters; ++i)
        writers.push_back(Start([&, i] { Write(shared, i); }));

    // Holders die at any moment: while taking the lock, while holding it, while releasing it.
    std::minstd_rand random(7);
    int left = kWriters, failures = 0, killed = 0;
    while (left > 0) {
        const pid_t holder = Start(Hold);
        ::usleep(static_cast<useconds_t>(random() % 3000));
        ::kill(holder, SIGKILL);
        ::waitpid(holder, nullptr, 0);
        ++killed;
        for (pid_t &writer : writers) {
            int status = 0;
            if (writer > 0 && ::waitpid(writer, &status, WNOHANG) == writer) {
                writer = 0;
                --left;
                failures += status != 0;
            }
        }
    }
    for (const pid_t reader : readers) {
        int status = 0;
        EXPECT_EQ(::waitpid(reader, &status, WNOHANG), 0) << "a reader saw half an increment: " << status;
        ::kill(reader, SIGKILL);
        ::waitpid(reader, &status, 0);
    }
    EXPECT_EQ(failures, 0);
    EXPECT_GT(killed, 5);
    EXPECT_EQ(shared.first, long{kWriters} * kIncrements);
    EXPECT_EQ(shared.second, long{kWriters} * kIncrements);
    ::munmap(memory, sizeof(Shared));
}

}  // namespace
