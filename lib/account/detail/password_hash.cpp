// Turns clear-text passwords into the hashes of the shadow file.
#include "account/detail/password_hash.h"

#include "account/detail/salt_char.h"

#include <memory>

#include <crypt.h>
#include <string.h>

namespace tavo {
namespace {

constexpr std::string_view kMd5 = "$1$";

std::string FreshSetting(time_t now)
{
    std::string setting(kMd5);
    setting += SaltChar(static_cast<int32_t>(now));
    setting += SaltChar(static_cast<int32_t>(static_cast<uint32_t>(now) + 10));
    return setting;
}

std::string Crypt(const std::string &clear, const std::string &setting)
{
    const auto scratch = std::make_unique_for_overwrite<crypt_data>();  // 32 KiB, of which this field is read
    scratch->initialized = 0;
    const char *hash = ::crypt_r(clear.c_str(), setting.c_str(), scratch.get());
    std::string result = hash && *hash != '*' ? hash : "";
    ::explicit_bzero(scratch.get(), sizeof *scratch);
    return result;
}

}  // namespace

std::string HashSetting(std::string_view previous, time_t now)
{
    const std::string setting = previous.starts_with(kMd5) ? std::string(previous) : std::string(kMd5).append(previous);
    if (setting.size() == kMd5.size() || setting[kMd5.size()] == '$')
        return FreshSetting(now);
    return setting;
}

std::string HashPassword(const std::string &clear, std::string_view previous, time_t now)
{
    std::string hash = Crypt(clear, HashSetting(previous, now));
    return hash.empty() ? Crypt(clear, FreshSetting(now)) : hash;
}

void Forget(std::string &secret) noexcept
{
    ::explicit_bzero(secret.data(), secret.size());
    secret.clear();
}

}  // namespace tavo
