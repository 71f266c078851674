// The daemons that answer the system's look-ups of users and groups from memory.
#ifndef TAVO_ACCOUNT_DETAIL_NAME_CACHES_H
#define TAVO_ACCOUNT_DETAIL_NAME_CACHES_H

namespace tavo {

// Makes nscd and sssd, where they run, forget the users and groups that they remember. A failure is logged; the error state
// and errno are as before.
void FlushNameCaches() noexcept;

}  // namespace tavo

#endif
