// Reads the pairs of a section into a hash.
#include "tavo_section.h"

#include "core/detail/guard.h"
#include "core/detail/line_reader.h"
#include "core/detail/open_file.h"
#include "core/detail/section_header.h"

#include <string>

namespace {

int ReadSection(int fd, const char *name, TLIBSZHASH **pairs)
{
    tavo::LineReader reader(fd);
    std::string_view line;
    bool found = false;
    while (!found && reader.Next(line))
        found = tavo::HeadsSection(line, name);
    std::string key, value;
    while (found && reader.Next(line) && !line.starts_with('[')) {
        const std::optional<tavo::KeyValue> pair = tavo::SplitAtEqualSign(line);
        if (!pair)
            continue;
        key = pair->key;
        value = pair->value;
        if (TLIBSzHashSetValue(pairs, key.c_str(), value.c_str()) < 0)
            return Fail(ERR_OUT_OF_MEMORY);
    }
    if (reader.Failed())
        return Fail(ERR_READ_FAILED);
    return TLIBSzHashGetLength(*pairs);
}

}  // namespace

extern "C" int TLIBFileGetSection(const char *szPath, const char *szSection, TLIBSZHASH **ppshHash)
{
    if (!szPath || !szSection || !ppshHash || !*ppshHash)
        return Fail(ERR_BAD_PARAMETERS, Line{54});
    const auto read_section = [&] {
        const tavo::Fd fd = tavo::OpenRegular(szPath, O_RDONLY);
        if (!fd)
            return Fail(ERR_OPEN_FAILED, Line{62});
        return ReadSection(fd.Get(), szSection, ppshHash);
    };
    return Guard(read_section, ERR_OUT_OF_MEMORY, Line{58});
}
