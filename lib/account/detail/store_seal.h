// The seal: a small file beside the stores of a family that records the state of the stores and the text files when
// they last agreed. As long as it matches, the stores are trusted. It is removed before a store is changed and written
// again when the change is complete. So a death, a failure, an edit, damage or a planted file in between leaves a seal
// that does not match, and the stores are rebuilt from the text files.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_SEAL_H
#define TAVO_ACCOUNT_DETAIL_STORE_SEAL_H

#include "account/detail/store_family.h"

#include <string>

namespace tavo {

// True when every store and text file is the very file, unchanged, that the seal knows, in this run of the machine.
bool SealHolds(const StoreFamily &family);

// Returns true when the stores are the files that were sealed. The text files may have changed since.
bool StoresAreWhole(const StoreFamily &family);

void BreakSeal(const StoreFamily &family) noexcept;

// Returns the state of the text files; call it before they are read. Empty, for which no seal is written, when one of
// them is not a regular file or memory runs out.
std::string StampTexts(const StoreFamily &family) noexcept;

// Seals the present stores together with the recorded state `texts` of the text files: if one was replaced meanwhile,
// the seal must not match. A seal that cannot be written only costs a rebuild at the next open.
void WriteSeal(const StoreFamily &family, const std::string &texts) noexcept;

// The family that a store file belongs to; nullptr for any other path.
const StoreFamily *FamilyOfStore(const char *path) noexcept;

// The mode of one of the stores of the families; 0 for any other path.
unsigned ModeOfStore(const char *path) noexcept;

}  // namespace tavo

#endif
