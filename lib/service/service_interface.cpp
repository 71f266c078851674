// Looks up services: by id, by name, and one field of a row at a time.
#include "tavo_service.h"

#include "core/detail/fault.h"
#include "service/detail/service_table.h"

#include <string_view>

namespace {

constexpr int kPrinter = 9;

// One field of a row; a bad id is reported as the look-up's own failure.
template <class Field>
auto FieldOf(int id, Field TAVOSERVICE::*field, Field none, tavo::Where where = tavo::Where())
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        Fail(ERR_BAD_PARAMETERS, where);
    return service ? service->*field : none;
}

}  // namespace

extern "C" const TAVOSERVICE *TAVOServiceInfoGet(int id)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        return FailNull(ERR_BAD_PARAMETERS);
    return service;
}

extern "C" int TAVOServiceIndexGet(const char *szName)
{
    if (!szName)
        return Fail(ERR_BAD_PARAMETERS);
    for (int id = 0; id < tavo::kServices; ++id) {
        if (std::string_view(tavo::service_table[id].szName) == szName)
            return id;
    }
    return -1;
}

extern "C" const char *TAVOServiceNameGet(int id)
{
    return FieldOf<const char *>(id, &TAVOSERVICE::szName, nullptr);
}

extern "C" const char *TAVOServiceScriptGet(int id)
{
    return FieldOf<const char *>(id, &TAVOSERVICE::szScript, nullptr);
}

extern "C" const char *TAVOServiceKeyGet(int id)
{
    return FieldOf<const char *>(id, &TAVOSERVICE::szKey, nullptr);
}

extern "C" const char *TAVOServiceProcGet(int id)
{
    return FieldOf<const char *>(id, &TAVOSERVICE::szProc, nullptr);
}

extern "C" int TAVOServiceDaemonIDGet(int id)
{
    return static_cast<int>(FieldOf<uint32_t>(id, &TAVOSERVICE::fDaemon, ~0u));
}

extern "C" const int32_t *TAVOServiceShareIDGet(int id)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        return FailNull(ERR_BAD_PARAMETERS);
    return service->rgShareId;
}

extern "C" int TAVOServiceTypeGet(int id)
{
    const TAVOSERVICE *service = tavo::FindService(id);
    if (!service)
        return Fail(ERR_BAD_PARAMETERS);
    if (id == kPrinter || !tavo::SharesOf(*service).empty())
        return 0;
    if (service->szScript)
        return 1;
    if (service->szKey)
        return 2;
    return service->fDaemon ? 3 : -1;
}
