// Reads the model's capabilities.
#include "core/detail/model_setting.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/key_value_line.h"
#include "core/detail/line_search.h"

#include <charconv>

#include <strings.h>

namespace tavo {

std::optional<std::string> ModelSetting(const char *key)
{
    Result<FoundLine> line = FindLineByKey(kFactorySettings, key, Match::first);
    return line ? std::optional<std::string>(LineValue(line->text)) : std::nullopt;
}

bool ModelHas(const char *key)
{
    const std::optional<std::string> value = ModelSetting(key);
    return value && ::strcasecmp(value->c_str(), "yes") == 0;
}

std::optional<uint64_t> ModelNumber(const char *key)
{
    const std::optional<std::string> value = ModelSetting(key);
    if (!value)
        return std::nullopt;
    uint64_t number = 0;
    const char *const end = value->data() + value->size();
    const auto [stop, error] = std::from_chars(value->data(), end, number);
    if (stop != end || error == std::errc::invalid_argument)
        return std::nullopt;
    return error == std::errc{} ? number : UINT64_MAX;
}

}  // namespace tavo
