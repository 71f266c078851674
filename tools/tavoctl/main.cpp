// tavoctl: what an administrator or a script runs to read and change the state of the appliance.
#include "frame/program.h"

int main(int argc, char **argv)
{
    return tavoctl::Program().Run({argv + (argc > 0 ? 1 : 0), argv + argc});
}
