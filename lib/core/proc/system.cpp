// Runs a command line through the shell in the caller's own surroundings.
#include "tavo_proc.h"

#include <cstdlib>

extern "C" int TLIBSystem(const char *szCommand)
{
    return szCommand ? std::system(szCommand) : 0;
}
