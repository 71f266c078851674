// The order of a list that is sorted without regard to case.
#include "tavo_list.h"

#include "core/detail/folded_text.h"

extern "C" int TLIBISzListUTF8StrCasecmp(const void *pLeft, const void *pRight)
{
    return tavo::OrderFolded(*static_cast<char *const *>(pLeft), *static_cast<char *const *>(pRight));
}
