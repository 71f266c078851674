// Reads the model's capabilities from /etc.defaults/tavoinfo.conf. A missing key is not a failure, so the error state
// is not touched.
#ifndef TAVO_CORE_DETAIL_MODEL_SETTING_H
#define TAVO_CORE_DETAIL_MODEL_SETTING_H

#include <cstdint>
#include <optional>
#include <string>

namespace tavo {

// Returns the value of a key; empty when the file does not set it. Throws bad_alloc.
std::optional<std::string> ModelSetting(const char *key);

// Returns whether the key's value is "yes".
bool ModelHas(const char *key);

// Returns a strictly decimal number; UINT64_MAX for a larger one. Empty when the file does not set the key or sets it
// to anything else.
std::optional<uint64_t> ModelNumber(const char *key);

}  // namespace tavo

#endif
