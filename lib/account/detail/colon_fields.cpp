// Splits and checks lines of colon-separated fields.
#include "account/detail/colon_fields.h"

#include "tavo_str.h"

#include "core/detail/strict_number.h"

#include <algorithm>
#include <climits>

namespace tavo {

std::vector<std::string_view> SplitColons(std::string_view line)
{
    while (!line.empty() && (line.back() == '\0' || line.back() == '\n'))
        line.remove_suffix(1);
    std::vector<std::string_view> fields;
    fields.reserve(9);
    for (;;) {
        const size_t colon = line.find(':');
        fields.push_back(line.substr(0, colon));
        if (colon == std::string_view::npos)
            return fields;
        line.remove_prefix(colon + 1);
    }
}

std::optional<int32_t> FieldNumber(std::string_view field)
{
    const auto number = StrictNumber<int64_t>(field);
    if (!number || *number < INT_MIN || *number > UINT_MAX)
        return std::nullopt;
    return static_cast<int32_t>(*number);
}

bool FitsInField(std::string_view text, bool colon_ends_it)
{
    return std::none_of(text.begin(), text.end(), [=](char byte) {
        return static_cast<unsigned char>(byte) < 0x20 || byte == 0x7F || (byte == ':' && colon_ends_it);
    });
}

std::string EncodeColons(const char *text)
{
    std::string encoded(static_cast<size_t>(TLIBStrEncodeColon(text, nullptr, 0)), '\0');
    TLIBStrEncodeColon(text, encoded.data(), static_cast<int>(encoded.size()));
    encoded.pop_back();
    return encoded;
}

std::string DecodeColons(std::string_view text)
{
    std::string decoded(text);
    if (text.find('%') == std::string_view::npos)
        return decoded;
    const int length = TLIBStrDecodeColon(decoded.c_str(), decoded.data(), static_cast<int>(decoded.size() + 1));
    decoded.resize(length > 0 ? static_cast<size_t>(length) - 1 : decoded.size());
    return decoded;
}

}  // namespace tavo
