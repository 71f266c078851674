// Sets the spin-down timer of all disks whose power is managed.
#ifndef TAVO_STORAGE_DETAIL_DISK_TIMER_H
#define TAVO_STORAGE_DETAIL_DISK_TIMER_H

namespace tavo {

// `value` as ATA encodes it. False when a disk that is there refused; the others have it all the same.
bool SetTimerOfAllDisks(int value);

}  // namespace tavo

#endif
