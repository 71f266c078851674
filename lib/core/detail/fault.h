// How an exported function reports a failure: code, module and line in one call that hands back the failure value.
//
// TAVO_MODULE is the base name of the file that is compiled; the build passes it, so a log line or an error state
// leads straight to the file.
#ifndef TAVO_CORE_DETAIL_FAULT_H
#define TAVO_CORE_DETAIL_FAULT_H

#include "tavo_error.h"

namespace tavo {

// Where the last failure was recorded. Read through TAVOErrorGetFile and TAVOErrorGetLine.
struct FaultSource {
    const char *module;
    int line;
};

extern FaultSource fault_source;

// A line number in a report. Written out (`Line{52}`) it is a published one: log watchers and support staff know it,
// so it stays when the code moves.
struct Line {
    int number;
};

namespace {

[[maybe_unused]] constexpr const char *kModule = TAVO_MODULE;

// Records the failure; for integer results.
[[maybe_unused]] inline int Fail(int code, Line line = Line{__builtin_LINE()}) noexcept
{
    TLIBErrSetEx(code, kModule, line.number);
    return -1;
}

// The same for pointer results.
[[maybe_unused]] inline decltype(nullptr) FailNull(int code, Line line = Line{__builtin_LINE()}) noexcept
{
    TLIBErrSetEx(code, kModule, line.number);
    return nullptr;
}

// The same for results whose failure value is 0 or false.
[[maybe_unused]] inline bool FailZero(int code, Line line = Line{__builtin_LINE()}) noexcept
{
    TLIBErrSetEx(code, kModule, line.number);
    return false;
}

}  // namespace

}  // namespace tavo

// Exported functions stand outside the namespace and report in every other line.
using tavo::Fail;
using tavo::FailNull;
using tavo::FailZero;
using tavo::Line;

#endif
