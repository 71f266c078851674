// tavoctl quota: limits on the space of users on volumes.
#include "account/user_record.h"
#include "families.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/progress.h"
#include "frame/table.h"
#include "storage/mounted_volumes.h"

#include "tavo_quota.h"

#include <cmath>
#include <cstdlib>

namespace tavoctl {
namespace {

constexpr char volume_help[] = "number of the volume: 1 for /volume1";
constexpr double kib_in_mb = 1024;

// "1536K", "1.5M", "2G", "1T"; a number alone counts megabytes; "none" takes the limit away.
float ParseLimit(const std::string &text)
{
    if (text == "none")
        return 0;
    char *end = nullptr;
    const double number = std::strtod(text.c_str(), &end);
    const std::string unit = end;
    const std::string units = "KMGT";
    const std::size_t power = unit.empty() ? 1 : units.find(unit[0]);
    if (end == text.c_str() || unit.size() > 1 || power == std::string::npos || !std::isfinite(number) || number < 0)
        throw UsageFailure("understand the limit " + text, "it is not of the form 1536K, 1.5M or 2G");
    return static_cast<float>(number * std::pow(kib_in_mb, static_cast<double>(power) - 1));
}

Cell LimitCell(const TAVOQUOTA &quota)
{
    if (quota.rLimit <= 0)
        return {};
    return static_cast<int64_t>(std::llround(static_cast<double>(quota.rLimit) * kib_in_mb));
}

class QuotaSwitch : public Verb {
  public:
    void Declare(Arguments &arguments) override { arguments.Number("VOLUME", "VOLUME", volume_, volume_help); }

  protected:
    std::string Volume() const { return "volume " + std::to_string(volume_); }
    int volume_ = -1;
};

class QuotaOn : public QuotaSwitch {
  public:
    static constexpr VerbInfo info = {"on", changes,
                                      "Switches quotas on: remounts the volume with them, counts what every user has "
                                      "there, and has the kernel enforce the limits. It takes a while on a full "
                                      "volume, and nobody may write to it meanwhile.",
                                      "tavoctl quota on 1"};

    int Run(const Call &) override
    {
        Progress progress("switching quotas on");
        progress.Show("counting what users have on " + Volume());
        if (TAVOQuotaInit(volume_) != 0)
            throw LibraryFailure("switch quotas on for " + Volume(),
                                 TLIBErrGet() == ERR_BAD_PARAMETERS ? "mount the volume first"
                                 : TLIBErrGet() == ERR_QUOTA_CHECK  ? "stop what writes to the volume"
                                                                    : "");
        return exit_done;
    }
};

class QuotaOff : public QuotaSwitch {
  public:
    static constexpr VerbInfo info = {"off", changes, "Switches quotas off. The limits stay for the next time.",
                                      "tavoctl quota off 1"};

    int Run(const Call &) override
    {
        if (TAVOQuotaOff(volume_) != 0)
            throw LibraryFailure("switch quotas off for " + Volume());
        return exit_done;
    }
};

class QuotaSet : public Verb {
  public:
    static constexpr VerbInfo info = {"set", changes,
                                      "Limits the space of a user on a volume; \"none\" takes the limit away. A number "
                                      "without a unit counts megabytes.",
                                      "tavoctl quota set anna 1 20G\n"
                                      "tavoctl quota set anna 1 1536K\n"
                                      "tavoctl quota set anna 1 none"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("USER", user_, "the account, in any case", UserNames);
        arguments.Number("VOLUME", "VOLUME", volume_, volume_help);
        arguments.Text("LIMIT", limit_, "such as 20G, 1.5M, 1536K, or none");
    }

    int Run(const Call &) override
    {
        const float limit = ParseLimit(limit_);
        const MountedVolume volume = FindVolume(volume_);
        if (TAVOQuotaSet(user_.c_str(), volume.device.c_str(), &limit) != 0)
            throw LibraryFailure("limit " + user_ + " on " + volume.path);
        return exit_done;
    }

  private:
    std::string user_;
    int volume_ = -1;
    std::string limit_;
};

class QuotaGet : public Verb {
  public:
    static constexpr VerbInfo info = {"get", reads, "Shows the limit and the use of one user on a volume.",
                                      "tavoctl quota get anna 1\n"
                                      "tavoctl quota get anna 1 --json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("USER", user_, "the account, in any case", UserNames);
        arguments.Number("VOLUME", "VOLUME", volume_, volume_help);
    }

    int Run(const Call &call) override
    {
        const MountedVolume volume = FindVolume(volume_);
        TAVOQUOTA quota = {};
        if (TAVOQuotaGet(user_.c_str(), volume.device.c_str(), &quota) != 0)
            throw LibraryFailure("read the limit of " + user_ + " on " + volume.path);
        Record record;
        record.Add("user", user_);
        record.Add("volume", volume.number);
        record.Add("limit_kib", LimitCell(quota));
        record.Add("used_bytes", static_cast<int64_t>(quota.cbUsed));
        call.Print(record);
        return exit_done;
    }

  private:
    std::string user_;
    int volume_ = -1;
};

class QuotaReport : public Verb {
  public:
    static constexpr VerbInfo info = {"report", reads,
                                      "Lists limit and use of every user on every volume that has quotas switched on, "
                                      "or on one.",
                                      "tavoctl quota report\n"
                                      "tavoctl quota report 1 --json"};

    void Declare(Arguments &arguments) override { arguments.OptionalText("VOLUME", volume_, volume_help); }

    int Run(const Call &call) override
    {
        std::vector<MountedVolume> volumes =
            volume_.empty() ? MountedVolumes() : std::vector<MountedVolume>{FindVolume(volume_)};
        if (volume_.empty())
            std::erase_if(volumes,
                          [](const MountedVolume &volume) { return TAVOQuotaFmtGet(volume.device.c_str()) < 0; });
        Table table({"volume", "user", "limit_kib", "used_bytes"});
        for (const MountedVolume &volume : volumes)
            for (const std::string &user : UserNames()) {
                TAVOQUOTA quota = {};
                if (TAVOQuotaGet(user.c_str(), volume.device.c_str(), &quota) == 0)
                    table.Add({volume.number, user, LimitCell(quota), static_cast<int64_t>(quota.cbUsed)});
                else if (TLIBErrGet() != ERR_NO_SUCH_USER)  // deleted since
                    throw LibraryFailure("read the limit of " + user + " on " + volume.path);
            }
        call.Print(table);
        return exit_done;
    }

  private:
    std::string volume_;
};

}  // namespace

void AddQuota(Program &program)
{
    Family &quota = program.Add("quota", "Limits on the space of users");
    quota.Add<QuotaOn>();
    quota.Add<QuotaOff>();
    quota.Add<QuotaSet>();
    quota.Add<QuotaGet>();
    quota.Add<QuotaReport>();
}

}  // namespace tavoctl
