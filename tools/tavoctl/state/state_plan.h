// The changes from the present state to that of a document.
#ifndef TAVOCTL_STATE_PLAN_H
#define TAVOCTL_STATE_PLAN_H

#include "account/account_plans.h"
#include "account/quota.h"
#include "network/net_apply.h"
#include "state/state_document.h"

#include <map>
#include <set>

namespace tavoctl {

class StatePlan {
  public:
    // Looks at everything that can be refused, and notes in the call what differs; throws a Failure.
    StatePlan(Call &call, const StateJson &document);

    // Settings, accounts and the network each as a whole; a Failure says what was done before. Then quotas and
    // services, each for itself: those that fail are warned of, named in the report and left out of its changes. With
    // --dry-run says only what would fail.
    void CarryOut(Call &call, bool probe);

    // A warning of everything that will not be done. True when there is something.
    bool WarnOfRefused(Call &call) const;

  private:
    // A quota or a service.
    struct Item {
        std::string name;
        std::size_t first, last;  // of its changes in the report
        std::optional<Failure> refused;
        std::function<void()> run;
    };

    void PlanSettings(Call &call, const StateJson &settings);
    void PlanQuota(Call &call, const StateJson &row, const std::string &place);
    void PlanService(Call &call, const StateJson &row, const std::string &place);
    void AddItem(Call &call, Item item);
    std::string MemberName(const std::string &name) const;
    void SetSettings() const;
    void SetAccounts() const;
    void CarryOutItems(Call &call);

    std::map<std::string, std::string> settings_;   // those that differ
    std::map<std::string, std::string> new_users_;  // their names, by their keys
    UserPlan users_;
    GroupPlan groups_;
    NetPlan net_;
    std::vector<Item> items_;
    std::set<int32_t> moved_;          // data folders, which services share
    std::set<int> volumes_to_switch_;  // quotas of which are to be switched on
};

// The changes that would make the storage that of the document.
void CompareStorage(Call &call, const StateJson &storage);

}  // namespace tavoctl

#endif
