// Arrays that are being brought up to date or spread over more members.
#ifndef TAVO_STORAGE_DETAIL_UNFINISHED_ARRAY_H
#define TAVO_STORAGE_DETAIL_UNFINISHED_ARRAY_H

namespace tavo {

// Has the kernel go on with what a power failure interrupted. Many kernels start arrays for reading only, until something
// is written: a rebuild waits for that, and so does who reads an array in the middle of a reshape.
void GoOnWithArray(int number);

}  // namespace tavo

#endif
