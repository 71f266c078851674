// The hashes of passwords: MD5-crypt for the shadow file, DES and MD4 for Samba's.
#include "core/detail/extras.h"
#include "extras/parts.h"

#include <crypt.h>
#include <nettle/des.h>
#include <nettle/md4.h>
#include <string.h>

namespace tavo::extras {

static_assert(sizeof(crypt_data) <= kCryptRoom && CRYPT_GENSALT_OUTPUT_SIZE <= kSaltRoom);

const char *Crypt(const char *clear, const char *setting, void *room) noexcept
{
    return ::crypt_r(clear, setting, static_cast<crypt_data *>(room));
}

const char *Salt(const char *prefix, char *out) noexcept
{
    return ::crypt_gensalt_rn(prefix, 0, nullptr, 0, out, static_cast<int>(kSaltRoom));
}

void Des(const uint8_t key[8], const uint8_t block[8], uint8_t out[8]) noexcept
{
    struct des_ctx des;
    nettle_des_set_key(&des, key);  // weak keys are as good as others here: short passwords give them
    nettle_des_encrypt(&des, DES_BLOCK_SIZE, out, block);
    ::explicit_bzero(&des, sizeof des);
}

void Md4(const uint8_t *data, size_t length, uint8_t digest[16]) noexcept
{
    struct md4_ctx md4;
    nettle_md4_init(&md4);
    nettle_md4_update(&md4, length, data);
    nettle_md4_digest(&md4, MD4_DIGEST_SIZE, digest);
    ::explicit_bzero(&md4, sizeof md4);
}

}  // namespace tavo::extras
