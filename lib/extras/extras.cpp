// The table by which the library finds what is in the small one.
#include "core/detail/extras.h"

#include "extras/parts.h"

extern "C" __attribute__((visibility("default"))) const tavo::Extras tavosdk_extras;

constinit const tavo::Extras tavosdk_extras = {
    tavo::kExtrasVersion,    sizeof tavosdk_extras,    tavo::extras::Fold,     tavo::extras::ToUtf16,
    tavo::extras::ToUtf8,    tavo::extras::Upper,      tavo::extras::UpperOne, tavo::extras::ToCodePage850,
    tavo::extras::Crypt,     tavo::extras::Salt,       tavo::extras::Des,      tavo::extras::Md4,
    tavo::extras::OpenBtree, tavo::extras::CloseBtree, tavo::extras::SyncBy,
};
