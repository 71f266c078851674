// Random operations on a hash and on the fuzzer's model of its table, compared after each.
#include "fuzz/hash_model.h"

#include "support/test.h"

#include <random>

TEST(HashModel, AgreesAtEveryStep)
{
    std::vector<uint8_t> bytes(2'000'000);
    std::generate(bytes.begin(), bytes.end(), std::mt19937(20261));
    fuzz::Input input(bytes.data(), bytes.size());
    fuzz::HashPair pair(input);
    while (!input.Empty())
        pair.Step();
    pair.CheckSlots();
}
