// Reads and writes lines of /etc/shadow.
#include "account/detail/shadow_line.h"

#include "account/detail/colon_fields.h"
#include "tavo_error.h"

namespace tavo {
namespace {

enum { kName, kHash, kLastChange, kMin, kMax, kWarn, kInactive, kExpire, kReserved, kFields };

constexpr int32_t kMaxAge = 99999;
constexpr int32_t kMinAgeOfNever = 100000;

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

}  // namespace tavo
