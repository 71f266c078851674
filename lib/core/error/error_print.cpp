// Prints the name of the code that the system's errno holds.
#include "tavo_error.h"

#include <cerrno>
#include <cstdio>

extern "C" void TLIBErrPrint(void)
{
    const int code = errno;  // errno, not tavoerrno: programs store a code there to have it printed
    const int index = code >> 8;
    if ((code & 0xFF) != 0 || index < 0 || index >= errNum)
        return;
    std::puts(rgszErrMsg[index]);
}
