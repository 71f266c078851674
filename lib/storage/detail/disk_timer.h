// Sets the spin-down timer of all disks whose power is managed.
#ifndef TAVO_STORAGE_DETAIL_DISK_TIMER_H
#define TAVO_STORAGE_DETAIL_DISK_TIMER_H

namespace tavo {

// Sets `value`, as ATA encodes it, on all disks. Returns false when a present disk refused; the others have it then.
bool SetTimerOfAllDisks(int value);

}  // namespace tavo

#endif
