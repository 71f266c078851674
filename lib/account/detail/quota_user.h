// The user that a quota is about.
#ifndef TAVO_ACCOUNT_DETAIL_QUOTA_USER_H
#define TAVO_ACCOUNT_DETAIL_QUOTA_USER_H

#include "core/detail/result.h"

#include <cstdint>

namespace tavo {

// 0; ERR_SYS_UNKNOWN for the name of a group, ERR_NO_SUCH_USER, or a code of TAVOUserGet. Leaves the error state alone.
Code FindQuotaUser(const char *name, int32_t &uid);

}  // namespace tavo

#endif
