// Sets the volume module's own error cell.
#include "tavo_error.h"

extern "C" void TAVOVolISetErr(int code)
{
    volerr = code;
}
