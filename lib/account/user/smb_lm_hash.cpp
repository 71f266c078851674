// The LAN Manager hash of a password.
#include "tavo_user.h"

#include "account/detail/password_text.h"
#include "core/detail/extras.h"
#include "core/detail/guard.h"

#include <algorithm>
#include <array>

namespace {

constexpr size_t kHalf = 7, kBlock = 8;

// Seven bytes are a key: 56 bits, spread over eight bytes whose lowest bit is an unchecked parity bit.
void EncryptMagic(const tavo::Extras &extras, const uint8_t *half, uint8_t *out)
{
    uint64_t bits = 0;
    for (size_t i = 0; i < kHalf; ++i)
        bits = bits << 8 | half[i];
    tavo::Wiped<std::array<uint8_t, kBlock>> key;
    for (size_t i = 0; i < kBlock; ++i)
        key[i] = static_cast<uint8_t>((bits >> (49 - 7 * i) & 0x7F) << 1);
    extras.des(key.data(), reinterpret_cast<const uint8_t *>("KGS!@#$%"), out);
}

}  // namespace

extern "C" int TLIBSmbLmHash(const char *szPasswd, unsigned char *rgHash)
{
    if (!szPasswd || !rgHash)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        tavo::SecretBytes oem;
        if (const tavo::Code code = tavo::UpperCodePage850(szPasswd, oem))
            return Fail(code);
        const tavo::Extras *extras = tavo::LoadExtras();
        if (!extras)
            return Fail(ERR_OP_FAILURE);
        tavo::Wiped<std::array<uint8_t, 2 * kHalf>> padded;
        std::copy_n(oem.begin(), std::min(oem.size(), padded.size()), padded.begin());
        EncryptMagic(*extras, padded.data(), rgHash);
        EncryptMagic(*extras, padded.data() + kHalf, rgHash + kBlock);
        return 0;
    });
}
