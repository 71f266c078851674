// Reads a bond from the kernel's bonding driver, and the options that make one.
#include "network/detail/bonding.h"

#include "core/detail/text_fields.h"

namespace tavo {
namespace {

struct BondRow {
    BondMode mode;
    std::string_view kernel;
    std::string_view options;
};

// clang-format off
constexpr BondRow kBonds[] = {
    {BondMode::lacp,     "802.3ad 4",       "\"mode=4 use_carrier=0 miimon=100 updelay=100 lacp_rate=fast\""},
    {BondMode::adaptive, "balance-alb 6",   "\"mode=balance-alb use_carrier=0 miimon=100 updelay=100\""},
    {BondMode::backup,   "active-backup 1", "\"mode=active-backup use_carrier=0 miimon=100 updelay=100 primary=eth0\""},
};
// clang-format on

constexpr std::string_view kPartner = "\tPartner Mac Address:";
constexpr std::string_view kNobody = "00:00:00:00:00:00";

}  // namespace

std::optional<BondMode> ParseBondMode(std::string_view text) noexcept
{
    const std::string_view line = TakeLine(text);
    for (const BondRow &row : kBonds) {
        if (row.kernel == line)
            return row.mode;
    }
    return std::nullopt;
}

std::string_view BondOptions(BondMode mode) noexcept
{
    for (const BondRow &row : kBonds) {
        if (row.mode == mode)
            return row.options;
    }
    return "";
}

std::string ParsePartnerMac(std::string_view text)
{
    while (!text.empty()) {
        const std::string_view line = TakeLine(text);
        if (!line.starts_with(kPartner))
            continue;
        const auto fields = SplitFields(line.substr(kPartner.size()));
        return fields.size() == 1 && fields[0] != kNobody ? std::string(fields[0]) : "";
    }
    return "";
}

}  // namespace tavo
