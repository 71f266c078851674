// The order of a list that is sorted by bytes.
#include "tavo_list.h"

#include <cstring>

extern "C" int TLIBISzListStrcmp(const void *pLeft, const void *pRight)
{
    return std::strcmp(*static_cast<char *const *>(pLeft), *static_cast<char *const *>(pRight));
}
