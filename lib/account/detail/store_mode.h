// The permissions of the stores.
#ifndef TAVO_ACCOUNT_DETAIL_STORE_MODE_H
#define TAVO_ACCOUNT_DETAIL_STORE_MODE_H

#include <sys/types.h>

namespace tavo {

// 0666, as the appliance's programs expect it: some of them run as other users. "account_store_mode" (octal) in
// /etc.defaults/tavoinfo.conf sets another one, such as 0600, where none does.
mode_t StoreMode();

}  // namespace tavo

#endif
