// The LAN Manager hash of a password.
#include "tavo_user.h"

#include "account/detail/password_text.h"
#include "core/detail/guard.h"

#include <algorithm>
#include <array>

#include <nettle/des.h>

namespace {

constexpr size_t kHalf = 7;

// Seven bytes are a key: 56 bits, spread over eight bytes whose lowest bit is the parity that nobody checks.
void EncryptMagic(const uint8_t *half, uint8_t *out)
{
    uint64_t bits = 0;
    for (size_t i = 0; i < kHalf; ++i)
        bits = bits << 8 | half[i];
    tavo::Wiped<std::array<uint8_t, DES_KEY_SIZE>> key;
    for (size_t i = 0; i < DES_KEY_SIZE; ++i)
        key[i] = static_cast<uint8_t>((bits >> (49 - 7 * i) & 0x7F) << 1);
    tavo::Wiped<des_ctx> des;
    nettle_des_set_key(&des, key.data());  // weak keys are as good as others here: short passwords give them
    nettle_des_encrypt(&des, DES_BLOCK_SIZE, out, reinterpret_cast<const uint8_t *>("KGS!@#$%"));
}

}  // namespace

extern "C" int TLIBSmbLmHash(const char *szPasswd, unsigned char *rgHash)
{
    if (!szPasswd || !rgHash)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::SecretBytes oem;
        if (const int code = tavo::UpperCodePage850(szPasswd, oem))
            return Fail(code);
        tavo::Wiped<std::array<uint8_t, 2 * kHalf>> padded;
        std::copy_n(oem.begin(), std::min(oem.size(), padded.size()), padded.begin());
        EncryptMagic(padded.data(), rgHash);
        EncryptMagic(padded.data() + kHalf, rgHash + DES_BLOCK_SIZE);
        return 0;
    });
}
