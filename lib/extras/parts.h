// The functions of the small library, as its table lists them.
#ifndef TAVO_EXTRAS_PARTS_H
#define TAVO_EXTRAS_PARTS_H

#include <cstddef>
#include <cstdint>

namespace tavo::extras {

int32_t Fold(int32_t code_point, int32_t *out, int32_t room) noexcept;
int32_t ToUtf16(const char *text, int32_t length, int32_t substitute, char16_t *out, int32_t room) noexcept;
int32_t ToUtf8(const char16_t *text, int32_t length, char *out, int32_t room) noexcept;
int32_t Upper(const char16_t *text, int32_t length, char16_t *out, int32_t room) noexcept;
int32_t UpperOne(int32_t code_point) noexcept;
int32_t ToCodePage850(const char16_t *text, int32_t length, char *out, int32_t room) noexcept;

const char *Crypt(const char *clear, const char *setting, void *room) noexcept;
const char *Salt(const char *prefix, char *out) noexcept;
void Des(const uint8_t key[8], const uint8_t block[8], uint8_t out[8]) noexcept;
void Md4(const uint8_t *data, size_t length, uint8_t digest[16]) noexcept;

void *OpenBtree(const char *path, int flags, int mode, bool parameters) noexcept;
int CloseBtree(void *store) noexcept;
void SyncBy(int (*sync)(int fd)) noexcept;

// While one of these lives, the database opens, closes and allocates through us: without memory for its environment it
// would crash, a file that cannot be closed it closes twice, one that cannot be set up it leaves open, and it writes what
// went wrong to the program's standard error.
class DatabaseCall {
  public:
    DatabaseCall() noexcept;
    ~DatabaseCall();
    DatabaseCall(const DatabaseCall &) = delete;
    DatabaseCall &operator=(const DatabaseCall &) = delete;

    bool Reserve() noexcept;          // memory for a failing open; false when there is none
    int CloseError() const noexcept;  // of a file that was closed; 0 for none
    void CloseLeft() noexcept;        // closes files that are still open

  private:
    bool is_owner_;
};

}  // namespace tavo::extras

#endif
