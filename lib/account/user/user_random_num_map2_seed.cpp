// One salt character for a number.
#include "tavo_user.h"

#include "account/detail/salt_char.h"

extern "C" char TAVOUserRandomNumMap2Seed(int n)
{
    return tavo::SaltChar(n);
}
