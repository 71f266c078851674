/* A program that links the library, and needs nothing that it loads later. */
#include "tavo_error.h"

int main(void)
{
    TLIBErrSet(ERR_SUCCESS);
    return TLIBErrGet() != ERR_SUCCESS;
}
