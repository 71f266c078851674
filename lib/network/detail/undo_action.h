// Carries out what puts a piece of the network back.
#ifndef TAVO_NETWORK_DETAIL_UNDO_ACTION_H
#define TAVO_NETWORK_DETAIL_UNDO_ACTION_H

#include "network/detail/undo_step.h"

namespace tavo {

// Routes that the kernel still has are left alone when `cleared` is false. False when an address could not be set.
bool CarryOut(const UndoStep &step, bool cleared);

}  // namespace tavo

#endif
