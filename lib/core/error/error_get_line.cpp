// Returns the line that recorded the last failure.
#include "tavo_error.h"

#include "core/detail/fault.h"

extern "C" int TAVOErrorGetLine(void)
{
    return tavo::fault_source.line;
}
