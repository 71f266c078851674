// tavoctl net export and apply: the whole network as one document.
#include "network/net_apply.h"

#include "tavo_lock.h"
#include "tavo_net.h"

#include "frame/files.h"
#include "frame/held_locks.h"
#include "frame/json_document.h"
#include "network/net_card.h"
#include "network/net_change.h"
#include "network/net_present.h"
#include "network/net_text.h"
#include "network/net_verbs.h"

#include <algorithm>
#include <cstdio>
#include <iostream>
#include <set>

namespace tavoctl {
namespace {

void Compare(const std::string &card, const std::vector<NetItem> &items, const NetFactsMap &wanted,
             const NetFactsMap &stored, const NetFactsMap &live, std::vector<NetDifference> &differences)
{
    for (const NetItem &item : items)
        if (const auto want = wanted.find(item.name); want != wanted.end())
            if (const auto now = Instead(item.name, want->second, stored, live))
                differences.push_back({card, &item, *now, want->second});
}

std::vector<NetDifference> DifferencesTo(const NetDocument &wanted)
{
    const NetDocument stored = StoredNet();
    std::vector<NetDifference> differences;
    Compare("", net_items, wanted.net, stored.net, LiveNet(stored).net, differences);
    for (const auto &[name, card] : wanted.cards) {
        const bool known = stored.cards.contains(name);
        const NetFactsMap file = known ? stored.cards.at(name) : NetFactsMap();
        // A lease is compared with nothing, an address that shall be there with what is.
        const std::string mode = TextOf(card.contains("mode") ? card : file, "mode");
        Compare(name, card_items, card, file, known ? LiveCard(name, mode) : NetFactsMap(), differences);
    }
    for (const std::string &name : wanted.absent)
        if (stored.cards.contains(name))
            differences.push_back({name, nullptr, "there", Cell()});
    return differences;
}

bool IsOnNetworkOf(const NetFactsMap &card, const std::string &gateway)
{
    std::vector<std::string> all = TextsOf(card, "more_addresses");
    all.push_back(TextOf(card, "address"));
    return TextOf(card, "mode") == "dhcp" ||
           std::any_of(all.begin(), all.end(), [&](const std::string &one) { return IsInNetwork(gateway, one); });
}

// A gateway that no card reaches today either, and that the document only repeats, is not the document's fault.
void RefuseLostGateway(const NetDocument &wanted, const NetDocument &stored)
{
    const std::string gateway = TextOf(wanted.net, "gateway");
    std::map<std::string, NetFactsMap> after = stored.cards;
    for (const auto &[name, card] : wanted.cards)
        if (card.contains("mode") || !after.contains(name))
            after[name] = card;
    for (const std::string &name : wanted.absent)
        after.erase(name);
    const auto reached = [&](const std::map<std::string, NetFactsMap> &cards) {
        return std::any_of(cards.begin(), cards.end(),
                           [&](const auto &card) { return IsOnNetworkOf(card.second, gateway); });
    };
    if (gateway.empty() || reached(after) || (gateway == TextOf(stored.net, "gateway") && !reached(stored.cards)))
        return;
    RefuseDocument("gateway", gateway + " is on the network of no card");
}

// The document's references to interfaces that are not listed or do not exist.
void RefuseUnknown(const NetDocument &wanted, const NetDocument &stored)
{
    const auto refuse = [](const std::string &card, const std::string &why) {
        RefuseDocument("card " + card, why, "tavoctl net show lists what is there");
    };
    const auto is_there = [&](const std::string &name) {
        const auto made = wanted.cards.find(name);
        return stored.cards.contains(name) ||
               (made != wanted.cards.end() && (made->second.contains("bond") || made->second.contains("vlan")));
    };
    std::set<std::string> members;
    for (const auto &[name, card] : wanted.cards) {
        const bool known = stored.cards.contains(name);
        if (!is_there(name))
            refuse(name, "there is no such interface");
        for (const std::string &member : TextsOf(card, "members")) {
            if (!stored.cards.contains(member) || stored.cards.at(member).contains("bond") ||
                stored.cards.at(member).contains("vlan"))
                refuse(name, member + " is not an Ethernet card");
            members.insert(member);
        }
        if (card.contains("parent") && !is_there(TextOf(card, "parent")))
            refuse(name, "there is no interface " + TextOf(card, "parent"));
        if (known && card.contains("bond") && !stored.cards.at(name).contains("bond"))
            refuse(name, "is a card and cannot become a bond");
        if (known && card.contains("vlan") && !stored.cards.at(name).contains("vlan"))
            refuse(name, "is a card and cannot become a VLAN");
    }
    for (const std::string &name : wanted.absent)
        if (const auto card = stored.cards.find(name);
            card != stored.cards.end() && !card->second.contains("bond") && !card->second.contains("vlan"))
            refuse(name, "only a bond or a VLAN can be removed");
    RefuseLostGateway(wanted, stored);
}

// The features that the start script keeps over a restart of the system.
std::set<std::string> Features()
{
    std::set<std::string> features;
    std::FILE *pipe = ::popen("/etc/rc.network features 2>/dev/null", "re");
    char line[256];
    while (pipe && std::fgets(line, sizeof line, pipe)) {
        std::string word = line;
        features.insert(word.substr(0, word.find('\n')));
    }
    if (pipe)
        ::pclose(pipe);
    return features;
}

void RefuseWhatIsNotKept(const std::vector<NetDifference> &differences)
{
    std::optional<std::set<std::string>> features;
    for (const NetDifference &one : differences) {
        if (!one.item || !one.item->feature[0])
            continue;
        if (!features)
            features = Features();
        FailIf(!features->contains(one.item->feature),
               "change " + one.card + (one.card.empty() ? "" : ".") + one.item->name,
               "/etc/rc.network would not keep it over a restart",
               "its \"features\" do not name " + std::string(one.item->feature));
    }
}

void RefuseUsedAddresses(const std::vector<NetDifference> &differences)
{
    for (const NetDifference &one : differences) {
        const std::string name = one.item ? one.item->name : "";
        TAVONETCARD card = {};
        if ((name != "address" && name != "more_addresses") || TAVONetGetCard(one.card.c_str(), &card) != 0)
            continue;
        std::vector<std::string> wanted;
        if (const auto *text = std::get_if<std::string>(&one.after.Get()))
            wanted.push_back(*text);
        if (const auto *texts = std::get_if<std::vector<std::string>>(&one.after.Get()))
            wanted = *texts;
        const NetFactsMap live = LiveCard(one.card, "static");
        std::vector<std::string> own = TextsOf(live, "more_addresses");
        own.push_back(TextOf(live, "address"));
        for (const std::string &address : wanted)
            if (std::none_of(own.begin(), own.end(),
                             [&](const auto &has) { return PlainAddress(has) == PlainAddress(address); }))
                RefuseUsedAddress(card, PlainAddress(address));
    }
}

void MakeChange(const NetDocument &wanted)
{
    // Other programs cannot change the network meanwhile. The guardian needs the lock to restore it.
    const HeldLocks lock(TAVO_LOCK_HOST, false, usual_wait);
    ApplyNet(wanted);
    Must(TAVONetHostsRefresh() >= 0, "bring /etc/hosts up to date");
    if (const auto left = DifferencesTo(wanted); !left.empty()) {
        const NetDifference &one = left.front();
        throw Failure{"change " + (one.card.empty() ? "the network" : one.card),
                      std::string(one.item ? one.item->name : "it") + " is " + one.before.Text() + " after the change"};
    }
}

}  // namespace

NetPlan PlanNet(Call &call, const std::string &text)
{
    NetPlan plan = {ParseNetDocument(text), {}};
    RefuseUnknown(plan.wanted, StoredNet());
    plan.differences = DifferencesTo(plan.wanted);
    for (const NetDifference &one : plan.differences)
        call.Change(one.card.empty() ? "network" : one.card, one.item ? one.item->name : "interface", one.before,
                    one.after);
    RefuseWhatIsNotKept(plan.differences);
    return plan;
}

void CarryOut(const NetPlan &plan, bool probe, const std::optional<int64_t> &trial_seconds)
{
    if (probe)
        RefuseUsedAddresses(plan.differences);
    // A change that was cut off does not belong to what this one goes back to.
    Must(TAVONetHostsRefresh() >= 0, "finish an earlier change");
    NetChange::Make(trial_seconds, [&] { MakeChange(plan.wanted); });
}

Action NetExport(Arguments &)
{
    return [](Call &) { std::cout << JsonOf(StoredNet()) << "\n"; };
}

Action NetApply(Arguments &in)
{
    const auto seconds = TrialOption(in);
    const auto no_probe = in.Flag("--no-probe", no_probe_help);
    const auto file = in.Text("FILE", file_path, "a document, or - for standard input");
    return [=](Call &call) {
        const NetPlan plan = PlanNet(call, ReadWhole(*file));
        if (call.Proceed())
            CarryOut(plan, !*no_probe, *seconds);
    };
}

}  // namespace tavoctl
