// Restores the error state: for calls of our own whose failure is an ordinary answer, such as a key that is not set.
#ifndef TAVO_CORE_DETAIL_KEEP_FAULT_H
#define TAVO_CORE_DETAIL_KEEP_FAULT_H

#include "core/detail/fault.h"

namespace tavo {

class KeepFault {
  public:
    KeepFault() noexcept = default;
    ~KeepFault()
    {
        tavoerrno = code_;
        fault_source = source_;
    }
    KeepFault(const KeepFault &) = delete;
    KeepFault &operator=(const KeepFault &) = delete;

  private:
    int32_t code_ = tavoerrno;
    FaultSource source_ = fault_source;
};

}  // namespace tavo

#endif
