// Releases a group record.
#include "tavo_group.h"

#include <cstdlib>

extern "C" void TAVOGroupFree(TAVOGROUP *pGroup)
{
    std::free(pGroup);
}
