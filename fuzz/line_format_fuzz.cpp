// Line formats: what is accepted is what printf would make of two texts, and nothing else than "%s" and "%%" gets there.
#include "tavo_section.h"

#include "core/detail/line_format.h"
#include "input.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>

using fuzz::Check;

namespace {

constexpr const char *kKey = "key%n";
constexpr const char *kValue = "a value of %s";

// The slow and obvious way: take all "%%" out, then all "%s"; two of those and no other percent sign may be left.
bool IsPlain(std::string format)
{
    for (size_t at = 0; (at = format.find('%', at)) != format.npos;) {
        if (format.compare(at, 2, "%%") == 0)
            format.replace(at, 2, "..");
        else
            at += 2;
    }
    int texts = 0;
    for (size_t at; (at = format.find("%s")) != format.npos; ++texts)
        format.replace(at, 2, "..");
    return texts == 2 && format.find('%') == format.npos;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string format = std::string(reinterpret_cast<const char *>(data), size).c_str();
    const std::optional<std::string> line = tavo::FormatLine(format.c_str(), kKey, kValue);
    Check(line.has_value() == IsPlain(format), "accepted or refused wrongly");
    if (line) {
        char *printed = nullptr;
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
        const int length = ::asprintf(&printed, format.c_str(), kKey, kValue);
#pragma GCC diagnostic pop
        Check(length >= 0 && *line == printed, "printf makes another line of it");
        std::free(printed);
    }
    if (TLIBIFileCheckFormat(format.c_str()) == 0) {
        Check(line.has_value(), "a section would be written with it");
        Check(line->find('=') != line->npos && line->find('\n') != line->npos, "it makes no setting");
    }
    return 0;
}
