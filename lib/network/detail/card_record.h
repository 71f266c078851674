// The record of an interface, read from its file and from the kernel.
#ifndef TAVO_NETWORK_DETAIL_CARD_RECORD_H
#define TAVO_NETWORK_DETAIL_CARD_RECORD_H

#include "tavo_net.h"

namespace tavo {

// Reads the index-th wired interface, from 0, into *card. 1; 0 when there are not that many; -1 when it has no address,
// with the rest of the record filled in.
int ReadCard(int index, TAVONETCARD *card);

}  // namespace tavo

#endif
