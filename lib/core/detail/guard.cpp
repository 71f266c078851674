// Turns exceptions into codes at the boundary.
#include "core/detail/guard.h"

#include "core/detail/log.h"

#include <new>
#include <stdexcept>

#include <pthread.h>

namespace tavo {

CancellationOff::CancellationOff() noexcept
{
    ::pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &before_);
}

CancellationOff::~CancellationOff()
{
    ::pthread_setcancelstate(before_, nullptr);
}

int CodeOfException(int out_of_memory, const Where &where) noexcept
{
    try {
        throw;
    } catch (const std::bad_alloc &) {
        return out_of_memory;
    } catch (const std::length_error &) {
        return out_of_memory;
    } catch (const std::exception &exception) {
        LogErrorAt(where, "%s:%d Unexpected exception: %s", exception.what());
    } catch (...) {
        LogErrorAt(where, "%s:%d Unexpected exception");
    }
    return ERR_UNKNOWN;
}

}  // namespace tavo
