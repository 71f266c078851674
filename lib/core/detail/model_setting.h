// What the model can do: /etc.defaults/tavoinfo.conf. Asking is no failure, so no error state is touched.
#ifndef TAVO_CORE_DETAIL_MODEL_SETTING_H
#define TAVO_CORE_DETAIL_MODEL_SETTING_H

#include <cstdint>
#include <optional>
#include <string>

namespace tavo {

inline constexpr const char *kModelSettings = "/etc.defaults/tavoinfo.conf";

// The value of a key; empty when the model does not say. Throws bad_alloc.
std::optional<std::string> ModelSetting(const char *key);

// Whether the model has what the key is about: "yes".
bool ModelHas(const char *key);

// A number of the model, strictly decimal; UINT64_MAX for a larger one. Empty when the model does not say or says something
// else.
std::optional<uint64_t> ModelNumber(const char *key);

}  // namespace tavo

#endif
