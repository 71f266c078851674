// Writes a section to memory.
#include "core/detail/section_text.h"

#include "core/detail/owner.h"
#include "tavo_section.h"

#include <new>

namespace tavo {

std::optional<std::string> SectionText(const char *name, const TLIBSZHASH *pairs, const char *format)
{
    char *written = nullptr;
    size_t length = 0;
    File stream(::open_memstream(&written, &length));
    if (!stream)
        throw std::bad_alloc();
    const bool accepted = ErrTLIBIFileHash2File(stream.Get(), name, pairs, format) == 0;
    const bool complete = stream.Close();
    const HeapBlock<char> text(written);
    if (!accepted)
        return std::nullopt;
    if (!complete)
        throw std::bad_alloc();
    return std::string(text.get(), length);
}

}  // namespace tavo
