// Any sequence of hash operations does what it does to the model.
#include "hash_model.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    fuzz::HashPair pair(input);
    while (!input.Empty())
        pair.Step();
    pair.CheckSlots();
    return 0;
}
