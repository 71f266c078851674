// The verbs of tavoctl net that are in files of their own.
#ifndef TAVOCTL_NET_VERBS_H
#define TAVOCTL_NET_VERBS_H

#include "frame/verb.h"

namespace tavoctl {

// The network interfaces of the kernel, without the loopback.
std::vector<std::string> InterfaceNames();

std::vector<std::string> Ipv6Of(const std::string &interface);  // its addresses
extern const ArgumentKind interface_kind;
extern const ArgumentKind ipv4_kind;  // of a host
inline constexpr char interface_help[] = "such as eth0";

inline constexpr char no_probe_help[] = "do not ask by ARP first whether another host uses the address";

// "--try SECONDS".
Given<std::optional<int64_t>> TrialOption(Arguments &in);

// Addresses, on trial or for good.
Action NetSet(Arguments &in);
Action NetConfirm(Arguments &in);

// The whole network as a document.
Action NetExport(Arguments &in);
Action NetApply(Arguments &in);

// IPv6, wake-on-LAN, bonds.
Action NetIpv6(Arguments &in);
Action NetWol(Arguments &in);
Action NetBonds(Arguments &in);
Action NetBond(Arguments &in);

// In the order of TAVONETLINKAGGR.nMode.
inline constexpr const char *bond_modes[] = {"none", "lacp", "adaptive", "backup"};

struct BondFacts {
    std::string bond;
    std::optional<std::string> mode;
    std::vector<std::string> members;
    std::optional<std::string> partner;
};

inline constexpr Column<BondFacts> bond_columns[] = {
    {"bond", field<&BondFacts::bond>},
    {"mode", field<&BondFacts::mode>, "lacp, adaptive or backup; null: another one"},
    {"members", field<&BondFacts::members>},
    {"partner", field<&BondFacts::partner>, "the switch at the other end of an 802.3ad bond"},
};

}  // namespace tavoctl

#endif
