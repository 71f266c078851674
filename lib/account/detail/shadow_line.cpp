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

int ParseShadowLine(std::string_view text, ShadowLine &line)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    line.name = fields[kName];
    line.hash = fields[kHash];
    line.expire = FieldNumber(fields[kExpire]).value_or(-1);
    // Lines of other tools may leave both ages empty: that sets no limit.
    line.cannot_change = FieldNumber(fields[kMax]).value_or(kMaxAge) <= FieldNumber(fields[kMin]).value_or(0);
    return 0;
}

std::string FormatShadowLine(const ShadowLine &line, time_t now)
{
    std::string text = line.name + ':' + line.hash + ':' + std::to_string(now / kSecondsOfDay) + ':';
    text += std::to_string(line.cannot_change ? kMinAgeOfNever : 0) + ':' + std::to_string(kMaxAge) + ":7::";
    return text + (line.expire < 0 ? "" : std::to_string(line.expire)) + ':';
}

int ReplaceShadowHash(std::string_view text, std::string_view hash, std::string &out)
{
    const std::vector<std::string_view> fields = SplitColons(text);
    if (fields.size() != kFields)
        return ERR_FORMAT_ERROR;
    out.assign(fields[kName]).append(":").append(hash);
    for (const int kept : {kLastChange, kMin, kMax})
        out.append(":").append(fields[static_cast<size_t>(kept)]);
    out.append(":7::").append(fields[kExpire]).append(":");
    return 0;
}

int ReplaceShadowAges(std::string_view text, const ShadowAges &ages, std::string &out)
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
    out = JoinColons(fields);
    return 0;
}

int ReplaceShadowLock(std::string_view text, bool locked, std::string &out)
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
    out = JoinColons(fields);
    return 0;
}

}  // namespace tavo
