// Any sequence of list operations does what it does to the model.
#include "list_model.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    fuzz::Input input(data, size);
    fuzz::ListPair pair(input);
    while (!input.Empty())
        pair.Step();
    return 0;
}
