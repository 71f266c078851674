// The library's error state as one value that tests compare and print.
#ifndef TESTS_SUPPORT_FAULT_STATE_H
#define TESTS_SUPPORT_FAULT_STATE_H

#include "tavo_error.h"

#include <gmock/gmock.h>

#include <ostream>
#include <string>

namespace test {

// As a log watcher sees it: code, module, line. Line 0 in an expected value means "not a published line": any will do.
struct Fault {
    int code = 0;
    std::string module = {};
    int line = 0;
};

inline Fault LastFault()
{
    return {TLIBErrGet(), TAVOErrorGetFile() ? TAVOErrorGetFile() : "", TAVOErrorGetLine()};
}

inline bool operator==(const Fault &left, const Fault &right)
{
    return left.code == right.code && left.module == right.module &&
           (left.line == right.line || left.line == 0 || right.line == 0);
}

inline std::ostream &operator<<(std::ostream &out, const Fault &fault)
{
    return out << std::hex << std::showbase << fault.code << std::dec << " from " << fault.module << ":" << fault.line;
}

// The fault of a call that fails with -1; none for any other result.
inline Fault FaultOf(int result)
{
    return result == -1 ? LastFault() : Fault{};
}

// Clears the state, so that a test sees exactly what the next call sets.
inline void ForgetFault()
{
    TLIBErrSet(ERR_SUCCESS);
}

}  // namespace test

#endif
