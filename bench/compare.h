// One piece of work, done by the library and by its peers: first shown to give the same result, then measured.
//
//     int main(int argc, char **argv)
//     {
//         bench::Compare("hash_build", 500, {{"tavo", [...] { ... return digest; }}, {"glib", ...}});
//         return bench::Run(argc, argv);
//     }
#ifndef BENCH_COMPARE_H
#define BENCH_COMPARE_H

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace bench {

struct Contender {
    std::string name;                // "tavo", or the peer
    std::function<uint64_t()> work;  // returns a number that depends on its result
};

// The measure of a benchmark: wall-clock time, or CPU time, which other load on the machine disturbs less. CPU time is
// for work that neither waits nor starts children.
enum class Clock { elapsed, processor };

// Ends the program when the contenders do not all give the same number. The first is what the others are compared to.
void Compare(const std::string &work, int size, const std::vector<Contender> &contenders, Clock clock = Clock::elapsed);

// Measures what has been compared; for main.
int Run(int argc, char **argv);

}  // namespace bench

#endif
