// tavoctl quota: limits on the space of users on volumes.
#include "account/quota.h"

#include "tavo_quota.h"

#include "account/user_record.h"
#include "families.h"
#include "frame/terminal.h"

#include <cmath>
#include <cstdlib>

namespace tavoctl {
namespace {

constexpr char volume_help[] = "number of the volume: 1 for /volume1";

// Megabytes of "1536K", "1.5M", "2G", "1T" or a number alone; "none" takes the limit away.
std::optional<double> LimitOf(const std::string &text)
{
    if (text == "none")
        return 0;
    char *end = nullptr;
    const double number = std::strtod(text.c_str(), &end);
    const std::string unit = end;
    const std::string units = "KMGT";
    const std::size_t power = unit.empty() ? 1 : units.find(unit[0]);
    if (end == text.c_str() || unit.size() > 1 || power == std::string::npos || !std::isfinite(number) || number < 0)
        return {};
    return number * std::pow(kib_in_mb, static_cast<double>(power) - 1);
}

constexpr ArgumentKind limit_kind = {
    .name = "limit",
    .allowed = "1536K, 1.5M, 20G, 1T, a number of megabytes, or none",
    .valid = [](const std::string &text) { return LimitOf(text).has_value(); },
    .sample = "20G",
    .wrong = "much",
};

UserQuota ReadQuota(const std::string &user, const MountedVolume &volume)
{
    const auto quota = QuotaOf(user, volume);
    Must(quota.has_value(), "read the limit of " + user + " on " + volume.path);
    return *quota;
}

// on and off.
template <bool on>
Action QuotaSwitch(Arguments &in)
{
    const auto volume = in.Number("VOLUME", "VOLUME", volume_help, 1, most_volumes);
    return [=](Call &call) {
        const MountedVolume mounted = FindVolume(static_cast<int>(**volume));
        call.Change(mounted.path, "quotas", HasQuotas(mounted), on);
        if (!call.Proceed())
            return;
        if (on)
            SwitchQuotasOn(mounted);
        else
            Must(TAVOQuotaOff(mounted.number) == 0, "switch quotas off for " + mounted.path);
    };
}

Action QuotaSet(Arguments &in)
{
    const auto user = in.Text("USER", user_kind, user_help);
    const auto number = in.Number("VOLUME", "VOLUME", volume_help, 1, most_volumes);
    const auto limit = in.Text("LIMIT", limit_kind, "such as 20G, 1.5M, 1536K, or none");
    return [=](Call &call) {
        const auto megabytes = static_cast<float>(*LimitOf(*limit));
        const MountedVolume volume = FindVolume(static_cast<int>(**number));
        const UserQuota before = ReadQuota(*user, volume);
        UserQuota after = before;
        after.limit.reset();
        if (megabytes > 0)
            after.limit = std::llround(static_cast<double>(megabytes) * kib_in_mb);
        call.Compare("user " + *user + " on " + volume.path, quota_columns, std::optional(before),
                     std::optional(after));
        if (call.Proceed())
            SetLimit(*user, volume, megabytes);
    };
}

Action QuotaGet(Arguments &in)
{
    const auto user = in.Text("USER", user_kind, user_help);
    const auto number = in.Number("VOLUME", "VOLUME", volume_help, 1, most_volumes);
    return [=](Call &call) { call.One(quota_columns, ReadQuota(*user, FindVolume(static_cast<int>(**number)))); };
}

Action QuotaReport(Arguments &in)
{
    const auto number = in.OptionalText("VOLUME", volume_kind, volume_help);
    return [=](Call &call) { call.List(quota_columns, *number ? QuotasOn(FindVolume(**number)) : AllQuotas()); };
}

}  // namespace

std::optional<UserQuota> QuotaOf(const std::string &user, const MountedVolume &volume)
{
    TAVOQUOTA quota = {};
    if (TAVOQuotaGet(user.c_str(), volume.device.c_str(), &quota) != 0)
        return {};
    UserQuota found = {user, volume.number, {}, static_cast<int64_t>(quota.cbUsed)};
    if (quota.rLimit > 0)
        found.limit = std::llround(static_cast<double>(quota.rLimit) * kib_in_mb);
    return found;
}

bool HasQuotas(const MountedVolume &volume)
{
    return TAVOQuotaFmtGet(volume.device.c_str()) >= 0;
}

std::vector<UserQuota> QuotasOn(const MountedVolume &volume)
{
    std::vector<UserQuota> quotas;
    for (const std::string &user : UserNames())
        if (const auto quota = QuotaOf(user, volume))
            quotas.push_back(*quota);
        else if (TLIBErrGet() != ERR_NO_SUCH_USER)  // deleted since
            throw LibraryFailure("read the limit of " + user + " on " + volume.path);
    return quotas;
}

std::vector<UserQuota> AllQuotas()
{
    std::vector<UserQuota> quotas;
    for (const MountedVolume &volume : MountedVolumes())
        if (HasQuotas(volume))
            for (const UserQuota &quota : QuotasOn(volume))
                quotas.push_back(quota);
    return quotas;
}

void SwitchQuotasOn(const MountedVolume &volume)
{
    Progress progress("switching quotas on");
    progress.Show("counting what users have on " + volume.path);
    Must(TAVOQuotaInit(volume.number) == 0, "switch quotas on for " + volume.path,
         HintFor{ERR_QUOTA_CHECK, "stop what writes to the volume"});
}

void SetLimit(const std::string &user, const MountedVolume &volume, float megabytes)
{
    Must(TAVOQuotaSet(user.c_str(), volume.device.c_str(), &megabytes) == 0, "limit " + user + " on " + volume.path);
}

void AddQuota(Program &program)
{
    Family &quota = program.Add("quota", "Limits on the space of users");
    quota.Add("on", changes, QuotaSwitch<true>, R"(Switches quotas on: remounts the volume with them, counts what every
user has there, and has the kernel enforce the limits. It takes a while on a full volume, and nobody may write to it
meanwhile.

tavoctl quota on 1)");
    quota.Add("off", changes, QuotaSwitch<false>, R"(Switches quotas off. The limits stay for the next time.

tavoctl quota off 1)");
    quota.Add("set", changes, QuotaSet, R"(Limits the space of a user on a volume; "none" takes the limit away. A
number without a unit counts megabytes.

tavoctl quota set anna 1 20G
tavoctl quota set anna 1 1536K
tavoctl quota set anna 1 none)");
    quota.Add("get", reads, Answer::One(quota_columns), QuotaGet,
              R"(Shows the limit and the use of one user on a volume.

tavoctl quota get anna 1
tavoctl quota get anna 1 --json)");
    quota.Add("report", reads, Answer::List(quota_columns), QuotaReport,
              R"(Lists limit and use of every user on every volume that has
quotas switched on, or on one.

tavoctl quota report
tavoctl quota report 1 --json)");
}

}  // namespace tavoctl
