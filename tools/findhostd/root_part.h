// The part of the daemon that keeps the rights of root: it writes the list, and ends the other part.
#ifndef FINDHOSTD_ROOT_PART_H
#define FINDHOSTD_ROOT_PART_H

namespace findhostd {

// Writes what the other part reports, until a signal asks for the end or the other part is gone. True when it was asked.
// `signals` is a descriptor that tells of signals.
bool KeepList(int reports, int signals);

}  // namespace findhostd

#endif
