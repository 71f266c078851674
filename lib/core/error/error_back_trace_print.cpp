// Reserved entry point: the appliance's programs call it, and there is no back trace to give.
#include "tavo_error.h"

extern "C" void TAVOErrorBackTracePrint(void)
{
}
