// Random operations on a list and on the fuzzer's model of it, compared after each.
#include "fuzz/list_model.h"

#include "support/test.h"

#include <random>

TEST(ListModel, AgreesAtEveryStep)
{
    std::vector<uint8_t> bytes(8'000'000);
    std::generate(bytes.begin(), bytes.end(), std::mt19937(20260));
    fuzz::Input input(bytes.data(), bytes.size());
    fuzz::ListPair pair(input);
    while (!input.Empty())
        pair.Step();
}
