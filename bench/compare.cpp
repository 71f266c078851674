// One piece of work, done by the library and by its peers.
#include "compare.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>

namespace bench {

void Compare(const std::string &work, int size, const std::vector<Contender> &contenders, Clock clock)
{
    const uint64_t expected = contenders.front().work();
    for (const Contender &contender : contenders) {
        const uint64_t found = contender.work();
        if (found != expected) {
            std::fprintf(stderr, "%s of %d: %s gives %llu, %s gives %llu\n", work.c_str(), size,
                         contenders.front().name.c_str(), static_cast<unsigned long long>(expected),
                         contender.name.c_str(), static_cast<unsigned long long>(found));
            std::exit(1);
        }
    }
    for (const Contender &contender : contenders) {
        const std::string name = work + "/" + std::to_string(size) + "/" + contender.name;
        auto *measured = benchmark::RegisterBenchmark(name.c_str(), [contender](benchmark::State &state) {
            for (auto _ : state)
                benchmark::DoNotOptimize(contender.work());
        });
        if (clock == Clock::elapsed)
            measured->UseRealTime();
    }
}

int Run(int argc, char **argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}

}  // namespace bench
