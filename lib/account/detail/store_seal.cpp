// Makes, checks and breaks the seal on the stores of a family.
#include "account/detail/store_seal.h"

#include "account/detail/free_name.h"
#include "core/detail/boot_id.h"
#include "core/detail/open_file.h"
#include "core/detail/temp_file.h"

#include <cinttypes>
#include <cstring>
#include <string>

namespace tavo {
namespace {

constexpr size_t kLargestSeal = 8192;

std::string ReadSmall(const Fd &fd)
{
    std::string text(kLargestSeal, '\0');
    const ssize_t length = fd ? ::read(fd.Get(), text.data(), text.size()) : 0;
    text.resize(length > 0 ? static_cast<size_t>(length) : 0);
    return text;
}

// Appends a line that changes with every change of the file. Returns false for anything but a regular file.
bool AddLine(std::string &text, const char *path, bool may_be_missing)
{
    struct stat st;
    char line[256];
    if (::lstat(path, &st) == 0) {
        if (!S_ISREG(st.st_mode))
            return false;
        std::snprintf(line, sizeof line,
                      " %" PRIuMAX " %" PRIuMAX " %u %o %" PRIdMAX " %" PRIdMAX ".%09ld %" PRIdMAX ".%09ld\n",
                      uintmax_t{st.st_dev}, uintmax_t{st.st_ino}, unsigned{st.st_uid}, unsigned{st.st_mode},
                      intmax_t{st.st_size}, intmax_t{st.st_mtim.tv_sec}, long{st.st_mtim.tv_nsec},
                      intmax_t{st.st_ctim.tv_sec}, long{st.st_ctim.tv_nsec});
    } else if (may_be_missing && errno == ENOENT) {
        std::strcpy(line, " missing\n");
    } else {
        return false;
    }
    text.append(path).append(line);
    return true;
}

// The seal's part about the stores; empty when they are incomplete.
std::string StoresText(const StoreFamily &family)
{
    // Stores are not synced to disk, so those that a crash of the machine left behind are not to be trusted.
    std::string text = BootId();
    for (const StoreRow &store : family.stores)
        if (!AddLine(text, store.path, false))
            return {};
    return text;
}

// The content of a matching seal; empty when there can be none.
std::string SealText(const StoreFamily &family, const std::string &texts)
{
    const std::string stores = StoresText(family);
    return stores.empty() || texts.empty() ? std::string() : stores + texts;
}

// Empty when there is none that root alone can have written.
std::string ReadSeal(const StoreFamily &family)
{
    const Fd fd = OpenFd(family.seal, O_RDONLY | O_NOFOLLOW);
    struct stat st;
    if (!fd || ::fstat(fd.Get(), &st) != 0 || !S_ISREG(st.st_mode) || (st.st_mode & 022) != 0 || st.st_uid != 0)
        return {};
    return ReadSmall(fd);
}

}  // namespace

bool SealHolds(const StoreFamily &family)
{
    const std::string sealed = ReadSeal(family);
    return !sealed.empty() && sealed == SealText(family, StampTexts(family));
}

bool StoresAreWhole(const StoreFamily &family)
{
    const std::string sealed = ReadSeal(family);
    const std::string stores = StoresText(family);
    return !stores.empty() && sealed.starts_with(stores);
}

void BreakSeal(const StoreFamily &family) noexcept
{
    FreeName(family.seal);
}

std::string StampTexts(const StoreFamily &family) noexcept
try {
    std::string text;
    for (const TextRow &file : family.texts)
        if (!AddLine(text, file.path, true))
            return {};
    return text;
} catch (const std::bad_alloc &) {
    return {};
}

void WriteSeal(const StoreFamily &family, const std::string &texts) noexcept
try {
    KeepErrno keep;
    BreakSeal(family);
    const std::string text = SealText(family, texts);
    if (text.empty())
        return;
    TempFile seal;  // under a name that other users cannot guess
    if (!seal.CreateBeside(family.seal) || !WriteAll(seal.Descriptor(), text))
        return;
    const std::string path = family.seal;
    if (!seal.RenameTo(path) && FreeName(family.seal))
        seal.RenameTo(path);
} catch (const std::bad_alloc &) {
}

const StoreFamily *FamilyOfStore(const char *path) noexcept
{
    for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
        for (const StoreRow &store : family->stores)
            if (std::strcmp(store.path, path) == 0)
                return family;
    return nullptr;
}

unsigned ModeOfStore(const char *path) noexcept
{
    for (const StoreFamily *family : {&kUserFamily, &kGroupFamily})
        for (const StoreRow &store : family->stores)
            if (std::strcmp(store.path, path) == 0)
                return store.mode;
    return 0;
}

}  // namespace tavo
