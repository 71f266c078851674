// Arrays whose data is being spread over more members.
#ifndef TAVO_STORAGE_DETAIL_RESHAPE_H
#define TAVO_STORAGE_DETAIL_RESHAPE_H

#include "storage/detail/array_name.h"
#include "storage/detail/kernel_text.h"
#include "storage/detail/partition_command.h"

namespace tavo {

// Has the kernel go on with what a power failure interrupted. Many kernels start arrays for reading only, until something
// is written, and reading such an array waits for that, too.
inline void GoOnReshaping(int number)
{
    const std::string state = ArrayFile(number, "md/array_state");
    if (KernelText(state) == "read-auto" &&
        KernelText(ArrayFile(number, "md/reshape_position")).value_or("none") != "none")
        RunDiskCommand("/bin/echo active > %s", state);
}

}  // namespace tavo

#endif
