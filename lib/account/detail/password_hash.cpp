// Turns clear-text passwords into the hashes of the shadow file.
#include "account/detail/password_hash.h"

#include "account/detail/salt_char.h"
#include "account/detail/setting_switch.h"

#include <cerrno>
#include <memory>
#include <new>

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

struct WipeScratch {
    void operator()(crypt_data *scratch) const noexcept
    {
        ::explicit_bzero(scratch, sizeof *scratch);
        delete scratch;
    }
};

std::string Crypt(const char *clear, const std::string &setting)
{
    const std::unique_ptr<crypt_data, WipeScratch> scratch(new crypt_data);  // 32 KiB, of which this field is read
    scratch->initialized = 0;
    errno = 0;
    const char *hash = ::crypt_r(clear, setting.c_str(), scratch.get());
    if (hash && *hash != '*')
        return hash;
    if (errno == ENOMEM)
        throw std::bad_alloc();
    return {};
}

// Empty when the system has no random bytes or does not know the method.
std::string RandomSetting(HashMethod method)
{
    char setting[CRYPT_GENSALT_OUTPUT_SIZE];
    const char *prefix = method == HashMethod::kSha512 ? "$6$" : "$y$";
    const char *made = ::crypt_gensalt_rn(prefix, 0, nullptr, 0, setting, sizeof setting);
    return made && *made != '*' ? made : "";
}

}  // namespace

std::string HashSetting(std::string_view previous, time_t now)
{
    const std::string setting = previous.starts_with(kMd5) ? std::string(previous) : std::string(kMd5).append(previous);
    if (setting.size() == kMd5.size() || setting[kMd5.size()] == '$')
        return FreshSetting(now);
    return setting;
}

HashMethod ConfiguredHashMethod()
{
    if (SettingIs(kFactorySettings, "password_hash", "sha512"))
        return HashMethod::kSha512;
    return SettingIs(kFactorySettings, "password_hash", "yescrypt") ? HashMethod::kYescrypt : HashMethod::kMd5;
}

std::string HashPassword(const char *clear, std::string_view previous, time_t now, HashMethod method)
{
    if (method != HashMethod::kMd5) {
        const std::string setting = RandomSetting(method);
        return setting.empty() ? setting : Crypt(clear, setting);
    }
    std::string hash = Crypt(clear, HashSetting(previous, now));
    return hash.empty() ? Crypt(clear, FreshSetting(now)) : hash;
}

}  // namespace tavo
