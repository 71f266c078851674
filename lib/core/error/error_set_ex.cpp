// Records a code with the module and the line that found the failure.
#include "tavo_error.h"

#include "core/detail/fault.h"

extern "C" void TLIBErrSetEx(int code, const char *szModule, int line)
{
    tavo::fault_source = {szModule, line};
    tavoerrno = code;
}
