// Writes a section to memory.
#include "core/detail/section_text.h"

#include "tavo_section.h"

#include "core/detail/owner.h"

#include <new>

namespace tavo {
namespace {

// The text written to a memory stream; freed after the stream is closed.
struct Memory {
    Memory() = default;
    ~Memory() { std::free(text); }
    Memory(const Memory &) = delete;
    Memory &operator=(const Memory &) = delete;

    char *text = nullptr;
    size_t length = 0;
};

}  // namespace

std::optional<std::string> SectionText(const char *name, const TLIBSZHASH *pairs, const char *format)
{
    Memory memory;
    const File stream(::open_memstream(&memory.text, &memory.length));
    if (!stream)
        throw std::bad_alloc();
    if (ErrTLIBIFileHash2File(stream.Get(), name, pairs, format) != 0)
        return std::nullopt;
    if (std::fflush(stream.Get()) != 0)
        throw std::bad_alloc();
    return std::string(memory.text, memory.length);  // before the close, which drops a text that it cannot shrink
}

}  // namespace tavo
