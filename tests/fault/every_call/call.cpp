// One call of every exported function: how a call is watched and what it returns.
#include "call.h"

#include "support/failing_malloc.h"
#include "support/test.h"
#include "support/traced_call.h"

namespace every_call {

Trial::Trial(Report &report, Watch watch, int failing_allocation)
    : report_(report), watch_(watch), failing_allocation_(failing_allocation)
{
    if (watch_ == Watch::allocations)
        test::StartCounting();
}

Trial::~Trial()
{
    if (watch_ == Watch::allocations)
        report_.live = test::StopCounting();
    report_.done = true;
}

void Trial::Begin()
{
    TLIBErrSet(ERR_SUCCESS);
    if (watch_ == Watch::allocations)
        test::FailAllocation(failing_allocation_);
    else if (watch_ == Watch::system_calls)
        test::MarkCalls();
}

void Trial::End()
{
    if (watch_ == Watch::allocations) {
        test::StopFailing();
        report_.fired = test::AllocationFailed();
        report_.database = test::FailedInside("libdb");
    } else if (watch_ == Watch::system_calls) {
        test::MarkCalls();
    }
    report_.code = TLIBErrGet();
}

void Trial::Show(std::string_view text)
{
    const size_t length = std::min(text.size(), sizeof report_.text - used_ - 2);
    std::memcpy(report_.text + used_, text.data(), length);
    used_ += length;
    report_.text[used_++] = ' ';
    report_.text[used_] = 0;
}

void Trial::Show(long long number)
{
    char text[24];
    std::snprintf(text, sizeof text, "%lld", number);
    Show(std::string_view(text));
}

void Trial::Show(const TLIBSZLIST *list)
{
    for (int i = 0; list && i < list->nItem; ++i)
        Show(std::string_view(list->pszItem[i]));
}

void Trial::Show(const TLIBSZHASH *hash)
{
    for (int slot = 0; hash && slot < hash->nSlot; ++slot) {
        if (hash->slots[slot].pszKey) {
            Show(std::string_view(hash->slots[slot].pszKey));
            Show(std::string_view(hash->slots[slot].pszValue));
        }
    }
}

void Trial::Show(const TAVOUSER *user)
{
    if (!user)
        return;
    for (const char *text : {user->szName, user->szPasswd, user->szHome, user->szMail})
        Show(std::string_view(text ? text : "(null)"));
    Show(static_cast<long long>(user->nUid));
    Show(static_cast<long long>(user->nPrivilege));
}

void Trial::Show(const TAVOGROUP *group)
{
    if (!group)
        return;
    Show(std::string_view(group->szName));
    for (char **member = group->rgszMember; *member; ++member)
        Show(std::string_view(*member));
}

bool WasFailed(long result)
{
    return result == -1 && (errno == EIO || errno == ENOSPC || errno == EACCES || errno == EMFILE || errno == EINTR);
}

}  // namespace every_call
