// Creates an empty hash of the usual size.
#include "tavo_hash.h"

namespace {

constexpr int kFirstSlots = 31;

}  // namespace

extern "C" TLIBSZHASH *PshTLIBSzHashAlloc(int cbStr)
{
    return PshTLIBIHashAllocator(kFirstSlots, cbStr);
}
