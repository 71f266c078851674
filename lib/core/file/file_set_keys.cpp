// Sets many keys in one safe rewrite.
#include "tavo_file.h"

#include "core/detail/guard.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_format.h"
#include "core/detail/line_reader.h"
#include "core/detail/list_owner.h"
#include "core/detail/log.h"
#include "core/detail/rewrite_report.h"
#include "core/detail/settings_text.h"

namespace {

std::optional<std::string> PairLine(const char *key, const char *value, const char *format)
{
    if (!tavo::IsWritableKey(key) || !tavo::IsWritableValue(value))
        return std::nullopt;
    return tavo::FormatLine(format, key, value);
}

// The pairs yet to be written: a copy of the caller's hash, emptied line by line.
class PairsLeft {
  public:
    PairsLeft(const TLIBSZHASH *pairs, const char *format)
        : pairs_(pairs), format_(format), left_(PshTLIBIHashAllocator(pairs->nSlot, pairs->nStrSize))
    {
        if (!left_ || TLIBICopyHash(left_.Get(), pairs) != 0)
            throw std::bad_alloc();
    }

    bool Knows(const std::string &key) const { return SzTLIBSzHashGetValue(pairs_, key.c_str()) != nullptr; }

    // Returns the key's line; empty when an earlier line has used it.
    std::string TakeLine(const char *key)
    {
        if (!SzTLIBSzHashGetValue(left_.Get(), key))
            return {};
        const char *value = SzTLIBSzHashRemoveKey(left_.Get(), key);
        if (!value) {
            LogError("%s:%d SzTLIBSzHashRemoveKey() szKey=%s", key);
            return {};
        }
        return PairLine(key, value, format_).value_or(std::string());
    }

  private:
    const TLIBSZHASH *pairs_;
    const char *format_;
    tavo::HashOwner left_;
};

std::string WithPairs(std::string_view text, const TLIBSZHASH *pairs, const TLIBSZLIST *keys, const char *format)
{
    PairsLeft left(pairs, format);
    std::string changed;
    changed.reserve(text.size());
    while (!text.empty()) {
        const std::string_view line = tavo::TakeWholeLine(text);
        const std::string key(tavo::LineKey(line));
        if (key.empty() || !left.Knows(key))
            changed += line;
        else
            changed += left.TakeLine(key.c_str());
    }
    for (int i = 0; i < keys->nItem; ++i) {
        if (const std::string line = left.TakeLine(keys->pszItem[i]); !line.empty())
            tavo::AppendLine(changed, line);
    }
    return changed;
}

}  // namespace

extern "C" int TLIBFileSetKeys(const char *szPath, const TLIBSZHASH *pshPairs, const char *szFormat)
{
    if (!szPath || !pshPairs)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::ListOwner keys(PslTLIBSzListAlloc(512));
        if (!keys || TLIBSzHashEnumKey(pshPairs, keys.Addr()) < 0) {
            LogError("%s:%d TLIBSzHashEnumKey() failed!");
            return Fail(ERR_OUT_OF_MEMORY);
        }
        for (int i = 0; i < keys->nItem; ++i) {
            const char *key = keys->pszItem[i];
            if (!PairLine(key, SzTLIBSzHashGetValue(pshPairs, key), szFormat)) {
                LogError("%s:%d TLIBILineKeyMoveHash2File() failed! szBuf=%s, szFormat=%s", key,
                         szFormat ? szFormat : tavo::kLineFormat);
                return Fail(ERR_BAD_PARAMETERS);
            }
        }
        return tavo::RewriteText(szPath, tavo::Missing::create, [&](std::string_view text) {
            return std::optional(WithPairs(text, pshPairs, keys.Get(), szFormat));
        });
    });
}
