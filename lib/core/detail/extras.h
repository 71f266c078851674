// Code that few callers need and that every program would pay for at its start: Unicode's tables, the database of the
// account stores, the hashes of passwords. It is in a small library, lib/extras, which is loaded on first use and stays
// loaded.
//
// Load before taking a lock or opening a file for change: a loaded library cannot fail in the middle.
#ifndef TAVO_CORE_DETAIL_EXTRAS_H
#define TAVO_CORE_DETAIL_EXTRAS_H

#include <cstddef>
#include <cstdint>

namespace tavo {

inline constexpr int32_t kNoResult = -1, kNoMemory = -2, kMostFolded = 8;
inline constexpr size_t kCryptRoom = 32 << 10, kSaltRoom = 192;

// The exports of the small library, as kExtrasSymbol. Its functions throw nothing and keep no state.
struct Extras {
    uint32_t version;  // kExtrasVersion: both libraries are from one build
    uint32_t size;     // of this table

    // Unicode. Lengths and capacities are counted in units of the text. Each function returns the length of the whole
    // result, even when it did not fit; kNoResult or kNoMemory on failure.
    int32_t (*fold)(int32_t code_point, int32_t *out, int32_t room);  // at most kMostFolded code points
    int32_t (*to_utf16)(const char *text, int32_t length, int32_t substitute, char16_t *out, int32_t room);
    int32_t (*to_utf8)(const char16_t *text, int32_t length, char *out, int32_t room);
    int32_t (*upper)(const char16_t *text, int32_t length, char16_t *out, int32_t room);  // in no particular language
    int32_t (*upper_one)(int32_t code_point);
    int32_t (*to_code_page_850)(const char16_t *text, int32_t length, char *out, int32_t room);

    // Hashes. `crypt` answers as crypt_r does; its kCryptRoom bytes belong to the caller and are zero at first.
    const char *(*crypt)(const char *clear, const char *setting, void *room);
    const char *(*salt)(const char *prefix, char out[kSaltRoom]);  // a random setting for crypt
    void (*des)(const uint8_t key[8], const uint8_t block[8], uint8_t out[8]);
    void (*md4)(const uint8_t *data, size_t length, uint8_t digest[16]);

    // The database: dbopen for a btree, whose handle is its own table of functions; the end of it, -1 with errno when
    // not everything was written; and the function that it calls in place of fsync (nullptr: fsync again).
    void *(*open_btree)(const char *path, int flags, int mode, bool parameters);
    int (*close_btree)(void *store);
    void (*sync_by)(int (*sync)(int fd));
};

inline constexpr uint32_t kExtrasVersion = 2;
inline constexpr char kExtrasFile[] = "libtavosdk-extras.so.1";
inline constexpr char kExtrasSymbol[] = "tavosdk_extras";
inline constexpr int32_t kNoSubstitute = -1;

// Returns nullptr when the small library cannot be loaded, which is logged once; the next call tries again. Keeps
// errno.
const Extras *LoadExtras() noexcept;

}  // namespace tavo

#endif
