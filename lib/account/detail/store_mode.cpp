// The permissions of the stores.
#include "account/detail/store_mode.h"

namespace tavo {

mode_t StoreMode()
{
    return 0666;
}

}  // namespace tavo
