// The seal: a small file beside the stores of a family that records what the stores and the text files looked like when
// they last agreed. As long as it matches, the stores can be trusted and read at once. It is broken before a store is
// changed and made anew when the change is complete, so whatever dies, fails, is edited, damaged or planted in between
// leaves a seal that does not match, and the stores are built anew from the text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_SEAL_H
#define TAVO_ACCOUNT_DETAIL_STORE_SEAL_H

#include "account/detail/store_family.h"

#include <string>

namespace tavo {

// True when every store and text file is the very file, unchanged, that the seal knows, in this run of the machine.
bool SealHolds(const StoreFamily &family);

// True when the stores at least are the very files that were sealed. They may differ from the text files by now.
bool StoresAreWhole(const StoreFamily &family);

void BreakSeal(const StoreFamily &family) noexcept;

// What the text files look like: to be taken before they are read. Empty, for which no seal is written, when one of them is
// no plain file or memory runs out.
std::string StampTexts(const StoreFamily &family) noexcept;

// Seals the stores as they are, to text files that looked like `texts`: somebody may have exchanged one meanwhile, and
// then this seal must not match. One that cannot be written costs a rebuild at the next open, nothing else.
void WriteSeal(const StoreFamily &family, const std::string &texts) noexcept;

// The family that a store file belongs to; nullptr for any other path.
const StoreFamily *FamilyOfStore(const char *path) noexcept;

// The mode of one of the stores of the families; 0 for any other path.
unsigned ModeOfStore(const char *path) noexcept;

}  // namespace tavo

#endif
