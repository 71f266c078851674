// Joins the items of a list into a caller's buffer.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <algorithm>
#include <cstring>

namespace {

// The caller's buffer, cleared; takes text up to its last byte but one.
class Joined {
  public:
    Joined(char *buffer, size_t size) : at_(buffer), left_(size - 1) { std::memset(buffer, 0, size); }

    bool Append(const char *text)
    {
        const size_t length = std::strlen(text);
        const size_t taken = std::min(length, left_);
        std::memcpy(at_, text, taken);
        at_ += taken;
        left_ -= taken;
        return taken == length;
    }

  private:
    char *at_;
    size_t left_;
};

}  // namespace

extern "C" int TLIBSzListDump2Str(const TLIBSZLIST *pList, const char *szSep, char *szBuf, int cbBuf)
{
    if (!pList || !szSep || !szBuf || cbBuf <= 0) {
        LogError({"%s:%d Parameter error", 37});
        return Fail(ERR_BAD_PARAMETERS, Line{36});
    }
    Joined joined(szBuf, static_cast<size_t>(cbBuf));
    size_t count = 0;
    for (int i = 0; i < pList->nItem; ++i) {
        const char *item = pList->pszItem[i];
        if (i > 0 && !joined.Append(szSep))
            return Fail(ERR_TRUNCATED, Line{50});
        if (!joined.Append(item))
            return Fail(ERR_TRUNCATED, Line{50});
        // Callers use the count as a sign of success. It has only ever counted the separators of empty items.
        if (i > 0 && !*item)
            count += std::strlen(szSep);
    }
    return static_cast<int>(count);
}
