// Reads and writes lines of /etc/shadow.
#include "account/detail/shadow_line.h"

#include "tavo_error.h"

#include "account/detail/colon_fields.h"

#include <algorithm>

namespace tavo {
namespace {

enum { kName, kHash, kLastChange, kMin, kMax, kWarn, kInactive, kExpire, kReserved, kFields };

constexpr int32_t kMaxAge = 99999;
constexpr int32_t kMinAgeOfNever = 100000;

std::string JoinColons(const std::vector<std::string_view> &fields)
{
    std::string text;
    for (const std::string_view field : fields)
        text.append(text.empty() ? "" : ":").append(field);
    return text;
}

}  // namespace

Result<ShadowLine> ParseShadowLine(std::string_view text)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    // Lines of other tools may leave both ages empty: that sets no limit.
    const bool cannot_change = FieldNumber(fields[kMax]).value_or(kMaxAge) <= FieldNumber(fields[kMin]).value_or(0);
    return ShadowLine{std::string(fields[kName]), std::string(fields[kHash]), FieldNumber(fields[kExpire]).value_or(-1),
                      cannot_change};
}

std::string FormatShadowLine(const ShadowLine &line, time_t now)
{
    std::string text = line.name + ':' + line.hash + ':' + std::to_string(now / kSecondsOfDay) + ':';
    text += std::to_string(line.cannot_change ? kMinAgeOfNever : 0) + ':' + std::to_string(kMaxAge) + ":7::";
    return text + (line.expire < 0 ? "" : std::to_string(line.expire)) + ':';
}

Result<std::string> ReplaceShadowHash(std::string_view text, std::string_view hash)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    std::string line(fields[kName]);
    line.append(":").append(hash);
    for (const int kept : {kLastChange, kMin, kMax})
        line.append(":").append(fields[static_cast<size_t>(kept)]);
    return line.append(":7::").append(fields[kExpire]).append(":");
}

Result<std::string> ReplaceShadowAges(std::string_view text, const ShadowAges &ages)
{
    std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    const int32_t least = FieldNumber(fields[kMin]).value_or(0);
    const int32_t most = FieldNumber(fields[kMax]).value_or(kMaxAge);
    const bool fixed = most <= least;
    if (fixed ? ages.least || ages.most : ages.most.value_or(most) <= ages.least.value_or(least))
        return ERR_BAD_PARAMETERS;
    std::string texts[kFields];
    const auto set = [&](size_t field, std::optional<int32_t> days) {
        if (days)
            fields[field] = texts[field] = std::to_string(*days);
    };
    set(kMin, ages.least);
    set(kMax, ages.most);
    set(kWarn, ages.warning);
    return JoinColons(fields);
}

Result<std::string> ReplaceShadowLock(std::string_view text, bool locked)
{
    std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    std::string hash(fields[kHash]);
    if (locked && !IsLockedHash(hash))
        hash.insert(0, 1, '!');
    if (!locked) {
        hash.erase(0, std::min(hash.find_first_not_of('!'), hash.size()));
        if (hash.empty() || hash.starts_with('*'))
            return ERR_BAD_PARAMETERS;
    }
    fields[kHash] = hash;
    return JoinColons(fields);
}

}  // namespace tavo
