// Removes a key by a safe rewrite.
#include "tavo_file.h"

#include "core/detail/key_value_line.h"
#include "core/detail/line_reader.h"
#include "core/detail/rewrite_report.h"

namespace {

std::optional<std::string> WithoutKey(std::string_view text, std::string_view key)
{
    const size_t old_size = text.size();
    std::string changed;
    changed.reserve(old_size);
    while (!text.empty()) {
        const std::string_view line = tavo::TakeWholeLine(text);
        if (!tavo::LineSetsKey(line, key))
            changed += line;
    }
    if (changed.size() == old_size)
        return std::nullopt;
    return changed;
}

}  // namespace

extern "C" int TLIBFileRemoveKey(const char *szPath, const char *szKey)
{
    if (!szPath || !szKey)
        return Fail(ERR_BAD_PARAMETERS);
    return tavo::RewriteText(szPath, tavo::Missing::fail,
                             [&](std::string_view text) { return WithoutKey(text, szKey); });
}
