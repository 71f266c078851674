// Records failures in the error state.
#include "core/detail/fault.h"

namespace tavo {

int Fail(int code, Where where) noexcept
{
    TLIBErrSetEx(code, ModuleOf(where), where.line);
    return -1;
}

decltype(nullptr) FailNull(int code, Where where) noexcept
{
    Fail(code, where);
    return nullptr;
}

bool FailZero(int code, Where where) noexcept
{
    Fail(code, where);
    return false;
}

int FailNone(int code, Where where) noexcept
{
    Fail(code, where);
    return 0;
}

}  // namespace tavo
