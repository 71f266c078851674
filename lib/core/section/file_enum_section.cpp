// Lists the names of a file's sections.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/section_header.h"

#include <string>

namespace {

constexpr size_t kLongestHeader = 1023;

// Between the first "[" and the last "]".
std::string SectionName(std::string_view header)
{
    header = tavo::TrimSetting(header);
    const size_t begin = header.find('[') + 1;
    return std::string(header.substr(begin, header.rfind(']') - begin));
}

}  // namespace

extern "C" int TLIBFileEnumSection(const char *szPath, TLIBSZLIST **ppslNames)
{
    if (!szPath || !ppslNames || !*ppslNames)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        const tavo::Fd fd = tavo::OpenRegular(szPath, O_RDONLY);
        if (!fd)
            return Fail(ERR_OPEN_FAILED);
        tavo::LineReader reader(fd.Get());
        std::string_view line;
        while (reader.Next(line)) {
            const std::string_view header = tavo::UpToNul(line);
            if (!tavo::IsSectionHeader(header))
                continue;
            if (line.size() > kLongestHeader)
                return -1;  // without a code, for compatibility
            if (TLIBSzListPush(ppslNames, SectionName(header).c_str()) < 0)
                return -1;  // the push has set its own
        }
        return reader.Failed() ? Fail(ERR_READ_FAILED) : (*ppslNames)->nItem;
    });
}
