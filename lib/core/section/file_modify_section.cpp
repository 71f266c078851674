// Replaces or removes a section by a safe rewrite.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/rewrite_report.h"
#include "core/detail/section_header.h"
#include "core/detail/section_text.h"

namespace {

constexpr int kWriteNew = 1;

struct Change {
    const char *section;
    const char *new_name;
    const TLIBSZHASH *pairs;
    int flags;
    const char *format;
};

// Returns the changed text; empty when the new section cannot be written, which has been reported.
std::optional<std::string> Changed(std::string_view text, const Change &change, bool &found)
{
    std::string changed;
    changed.reserve(text.size());
    bool inside = false;
    while (!text.empty()) {
        const std::string_view line = tavo::TakeWholeLine(text);
        if (tavo::IsSectionHeader(line))
            inside = false;
        if (tavo::HeadsSection(line, change.section)) {
            inside = found = true;
            if ((change.flags & kWriteNew) != 0) {
                const auto section = tavo::SectionText(change.new_name, change.pairs, change.format);
                if (!section)
                    return std::nullopt;
                changed += *section;
            }
        } else if (!inside || tavo::IsCommentLine(line)) {
            changed += line;
        }
    }
    return changed;
}

}  // namespace

extern "C" int TLIBIFileModifySection(const char *szPath, const char *szSection, const char *szNewName,
                                      const TLIBSZHASH *pshPairs, int flags, const char *szFormat)
{
    if (!szPath || !szSection)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::FileRewrite rewrite;
        std::string text;
        if (const tavo::Code code = rewrite.Open(szPath))
            return Fail(code);
        if (!rewrite.Read(text))
            return Fail(ERR_READ_FAILED);
        bool found = false;
        const Change change{szSection, szNewName ? szNewName : szSection, pshPairs, flags, szFormat};
        const std::optional<std::string> changed = Changed(text, change, found);
        if (!changed || tavo::ReplaceOrFail(rewrite, *changed) != 0)
            return -1;
        return found ? 1 : FailNone(ERR_KEY_NOT_FOUND);
    });
}
