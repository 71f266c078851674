// Extras of another version, for a library that must not use them.
#include "core/detail/extras.h"

extern "C" __attribute__((visibility("default"))) const tavo::Extras tavosdk_extras;

constinit const tavo::Extras tavosdk_extras = {.version = tavo::kExtrasVersion + 1, .size = sizeof tavosdk_extras};
