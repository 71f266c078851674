// How an exported function reports a failure: one call records code, module and line and returns the failure value.
#ifndef TAVO_CORE_DETAIL_FAULT_H
#define TAVO_CORE_DETAIL_FAULT_H

#include "tavo_error.h"

#include "core/detail/where.h"

namespace tavo {

// Where the last failure was recorded. Read through TAVOErrorGetFile and TAVOErrorGetLine.
struct FaultSource {
    const char *module;
    int line;
};

extern FaultSource fault_source;

// Records the failure; for integer results.
int Fail(int code, Where where = Where()) noexcept;

// The same for pointer results.
decltype(nullptr) FailNull(int code, Where where = Where()) noexcept;

// The same for results whose failure value is false.
bool FailZero(int code, Where where = Where()) noexcept;

// The same for integer results where 0 is the answer that there is none.
int FailNone(int code, Where where = Where()) noexcept;

}  // namespace tavo

// Exported functions are outside the namespace and report in every other line.
using tavo::Fail;
using tavo::FailNone;
using tavo::FailNull;
using tavo::FailZero;

#endif
