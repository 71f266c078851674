// Reads many values into a hash.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"
#include "core/detail/open_file.h"

#include <string>

namespace {

// Removes a key from the list of wanted ones; false when it was not on it.
bool TakeWanted(TLIBSZLIST *wanted, const std::string &key)
{
    bool taken = false;
    for (int at; (at = TLIBSzListFind(wanted, key.c_str())) >= 0; taken = true)
        SzTLIBSzListRemove(wanted, at);
    return taken;
}

int ReadPairs(int fd, TLIBSZLIST *wanted, TLIBSZHASH **pairs, const char *separators)
{
    const bool all = wanted->nItem == 0;
    tavo::LineReader reader(fd);
    std::string_view line;
    std::string key, value;
    while (reader.Next(line) && (all || wanted->nItem > 0)) {
        const std::optional<tavo::KeyValue> pair = tavo::SplitLine(line, separators);
        if (!pair)
            continue;
        key = pair->key;
        value = pair->value;
        if ((all || TakeWanted(wanted, key)) && TLIBSzHashSetValue(pairs, key.c_str(), value.c_str()) < 0)
            return Fail(ERR_OUT_OF_MEMORY);
    }
    if (reader.Failed())
        return Fail(ERR_READ_FAILED);
    return TLIBSzHashGetLength(*pairs);
}

}  // namespace

extern "C" int TLIBFileGetKeys(const char *szPath, const TLIBSZLIST *pslKeys, TLIBSZHASH **ppshHash, const char *szSep)
{
    if (!szPath || !ppshHash || !*ppshHash || !szSep)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::ListOwner wanted(PslTLIBSzListAlloc(512));
        if (!wanted)
            return Fail(ERR_OUT_OF_MEMORY);
        const tavo::Fd fd = tavo::OpenRegular(szPath, O_RDONLY);
        if (!fd)
            return Fail(ERR_OPEN_FAILED);
        if (pslKeys && !PslTLIBSzListOr(wanted.Addr(), pslKeys, 0)) {
            LogError("%s:%d PslTLIBSzListOr() failed!! tavoerr=[0x%04X]", tavoerrno);
            return Fail(tavoerrno);
        }
        return ReadPairs(fd.Get(), wanted.Get(), ppshHash, szSep);
    });
}
