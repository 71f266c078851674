// A section as text, in the format of ErrTLIBIFileHash2File.
#ifndef TAVO_CORE_DETAIL_SECTION_TEXT_H
#define TAVO_CORE_DETAIL_SECTION_TEXT_H

#include "tavo_hash.h"

#include <optional>
#include <string>

namespace tavo {

// Empty when it cannot be written; the error state then has the reason.
std::optional<std::string> SectionText(const char *name, const TLIBSZHASH *pairs, const char *format);

}  // namespace tavo

#endif
