// Records a code without a source; for programs that use the library.
#include "tavo_error.h"

extern "C" void TLIBErrSet(int code)
{
    TLIBErrSetEx(code, nullptr, 0);
}
