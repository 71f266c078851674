// Returns the code of the last failure.
#include "tavo_error.h"

extern "C" int TLIBErrGet(void)
{
    return tavoerrno;
}
