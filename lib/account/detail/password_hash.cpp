// Turns clear-text passwords into the hashes of the shadow file.
#include "account/detail/password_hash.h"

#include "account/detail/salt_char.h"
#include "account/detail/secret_text.h"
#include "core/detail/extras.h"
#include "core/detail/setting_switch.h"

#include <cerrno>
#include <new>

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

std::string Crypt(const Extras &extras, const char *clear, const std::string &setting)
{
    SecretBytes room(kCryptRoom);
    errno = 0;
    const char *hash = extras.crypt(clear, setting.c_str(), room.data());
    if (hash && *hash != '*')
        return hash;
    if (errno == ENOMEM)
        throw std::bad_alloc();
    return {};
}

// Empty when the system has no random bytes or does not know the method.
std::string RandomSetting(const Extras &extras, HashMethod method)
{
    char setting[kSaltRoom];
    const char *made = extras.salt(method == HashMethod::sha512 ? "$6$" : "$y$", setting);
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
    const std::optional<bool> sha512 = ReadSetting(kFactorySettings, "password_hash", "sha512");
    const std::optional<bool> yescrypt = ReadSetting(kFactorySettings, "password_hash", "yescrypt");
    if (!sha512 || !yescrypt)
        return HashMethod::unknown;
    return *sha512 ? HashMethod::sha512 : *yescrypt ? HashMethod::yescrypt : HashMethod::md5;
}

std::string HashPassword(const char *clear, std::string_view previous, time_t now, HashMethod method)
{
    const Extras *extras = LoadExtras();
    if (!extras)
        return {};
    if (method != HashMethod::md5) {
        const std::string setting = RandomSetting(*extras, method);
        return setting.empty() ? setting : Crypt(*extras, clear, setting);
    }
    std::string hash = Crypt(*extras, clear, HashSetting(previous, now));
    return hash.empty() ? Crypt(*extras, clear, FreshSetting(now)) : hash;
}

}  // namespace tavo
