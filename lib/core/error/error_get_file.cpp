// Returns the module that recorded the last failure.
#include "tavo_error.h"

#include "core/detail/fault.h"

extern "C" const char *TAVOErrorGetFile(void)
{
    return tavo::fault_source.module;
}
