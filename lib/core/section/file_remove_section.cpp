// Removes a section.
#include "tavo_section.h"

extern "C" int ErrTLIBFileRemoveSection(const char *szPath, const char *szSection)
{
    return TLIBIFileModifySection(szPath, szSection, nullptr, nullptr, 0, nullptr);
}
