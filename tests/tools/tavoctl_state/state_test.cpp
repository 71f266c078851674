// tavoctl state: a document of one appliance makes another one the same, once; what is refused is refused before.
#include "support/domain_entries.h"
#include "support/machine.h"
#include "support/test.h"
#include "support/virtual_cable.h"
#include "tools/tavoctl/run_tavoctl.h"

#include <sys/mount.h>

using nlohmann::json;
using test::Ran;
using test::ReadFile;
using test::Tavoctl;
using test::Words;
using test::WriteFile;
using testing::AllOf;
using testing::HasSubstr;

namespace {

constexpr char kFile[] = "/tmp/box.json";
constexpr char kCarried[] = "/root/box.json";  // nodes have a /tmp each

// Every file of the state with its inode.
std::string Files()
{
    test::ShellStatus("find /etc /usr/tavo/etc /var/services -type f -o -type l 2>/dev/null | grep -v '/[.]' | sort | "
                      "while read f; do echo $(ls -id $f) $(stat -c %a $f) $(md5sum <$f); done >/root/files 2>&1");
    return ReadFile("/root/files");
}

Ran Apply(const json &document, Words options = {})
{
    json whole = document;
    whole["format_version"] = 1;
    WriteFile(kFile, whole.dump());
    Words words = {"state", "apply", "--json", "--no-probe", kFile};
    words.insert(words.end(), options.begin(), options.end());
    return Tavoctl(words);
}

Ran Apply(const char *text, const Words &options = {})
{
    return Apply(json::parse(text), options);
}

json Shown(const Words &options = {"--secrets"})
{
    Words words = {"state", "show"};
    words.insert(words.end(), options.begin(), options.end());
    return test::Facts(Tavoctl(words));
}

class TavoctlState : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootLacks("foreign-exec"))
            GTEST_SKIP() << "runs tavoctl";
    }
};

class TavoctlStateOfABox : public testing::Test {
  protected:
    void SetUp() override
    {
        if (const std::string missing = test::VirtualCable::Missing(); !missing.empty())
            GTEST_SKIP() << missing;
        if (test::RootLacks("foreign-exec") || test::RootLacks("mount"))
            GTEST_SKIP() << "runs tavoctl on volumes";
        for (const char *volume : {"/volume1", "/volume2"}) {
            ::mkdir(volume, 0755);
            ASSERT_EQ(::mount("tmpfs", volume, "tmpfs", 0, volume[7] == '1' ? "size=4m" : "size=8m"), 0);
        }
        cable_.emplace("cable");
    }
    void TearDown() override
    {
        for (const char *volume : {"/volume1", "/volume2"})
            ::umount2(volume, MNT_DETACH);
    }

    std::unique_ptr<test::Node> Box(const char *name)
    {
        auto box = std::make_unique<test::Node>(name);
        cable_->Plug(*box, "eth0");
        EXPECT_EQ(
            box->Shell("rm -rf /usr/tavo/etc/private/smbpasswd /usr/tavo/etc/share.conf /var/services /var/standin/*; "
                       "mkdir -p /var/services; /etc/rc.network start"),
            0);
        return box;
    }

    std::optional<test::VirtualCable> cable_;
};

TEST_F(TavoctlStateOfABox, ComesBackOnAFreshOneAndThenChangesNothing)
{
    auto old_box = Box("old");
    old_box->Do([] {
        for (const Words &words : std::vector<Words>{
                 {"service", "enable", "userhome"},
                 {"conf", "set", "motto", "a \\ b"},
                 {"user", "add", "anna", "--description", "Anna Berg", "--mail", "a@example.com", "--uid", "2001"},
                 {"user", "add", "Berta", "--privilege", "0x23", "--expires", "2037-01-31"},
                 {"user", "add", "open", "--empty-password", "--shell", "/bin/sh"},
                 {"user", "passwd", "admin"},
                 {"group", "add", "staff", "--members", "Berta,anna", "--description", "all of us", "--gid", "70000"},
                 {"group", "add", "nobody-yet"},
                 {"service", "enable", "media", "ftp"},
                 {"service", "volume", "media", "/volume1"},
                 {"service", "disable", "samba"}}) {
            const Ran ran = Tavoctl(words, "secret of " + words.back() + "\n");
            EXPECT_EQ(ran.status, 0) << testing::PrintToString(words) << ran;
        }
        WriteFile("/tmp/net.json", R"({"format_version": 1, "hostname": "attic", "gateway": "192.0.2.1",
            "dns": ["192.0.2.53"], "cards": [{"name": "eth0", "address": "192.0.2.10/24", "mtu": 1400}]})");
        const Ran net = Tavoctl({"net", "apply", "--no-probe", "/tmp/net.json"});
        EXPECT_EQ(net.status, 0) << net;
        EXPECT_EQ(Tavoctl({"state", "show", "--secrets", "--output", kCarried}).status, 0);
        struct stat facts = {};
        EXPECT_EQ(::stat(kCarried, &facts), 0);
        EXPECT_EQ(facts.st_mode & 0777, 0600u);
        EXPECT_EQ(Apply(json::parse(ReadFile(kCarried))).out, Apply(json::object()).out) << "nothing differs here";
        EXPECT_THAT(Tavoctl({"state", "show"}).out, AllOf(HasSubstr("Anna Berg"), testing::Not(HasSubstr("nt_hash"))));
        EXPECT_EQ(Tavoctl({"service", "disable", "media", "ftp"}).status, 0);
    });
    old_box.reset();
    auto fresh = Box("fresh");
    fresh->Do([] {
        const json wanted = json::parse(ReadFile(kCarried));
        EXPECT_GE(wanted.at("users").size(), 4u) << wanted;
        EXPECT_EQ(wanted.at("settings").at("motto"), "a \\ b");
        const std::string before = Files();
        const Ran differs = Tavoctl({"state", "diff", "--json", kCarried});
        EXPECT_EQ(differs.status, 1) << differs;
        const Ran planned = Apply(wanted, {"--dry-run"});
        EXPECT_EQ(planned.status, 0) << planned;
        EXPECT_EQ(Files(), before);
        const Ran ran = Apply(wanted);
        EXPECT_EQ(ran.status, 0) << ran;
        EXPECT_EQ(json::parse(ran.out).at("changes"), json::parse(planned.out).at("changes"));
        EXPECT_EQ(json::parse(ran.out).at("changes"), test::Facts(differs));
        EXPECT_THAT(ran.out + differs.out, testing::Not(HasSubstr(wanted.at("users").at(1).at("nt_hash"))));
        const json again = json::parse(Tavoctl({"state", "show", "--secrets"}).out);
        EXPECT_EQ(json::diff(wanted, again), json::array());
        EXPECT_EQ(test::Facts({"user", "check", "--json"}), json::array());
        EXPECT_EQ(test::Facts({"group", "check", "--json"}), json::array());

        const std::string after = Files();
        const Ran second = Apply(wanted);
        EXPECT_EQ(second.status, 0) << second;
        EXPECT_EQ(json::parse(second.out).at("changed"), false) << second;
        EXPECT_EQ(Files(), after);
        const Ran same = Tavoctl({"state", "diff", kCarried});
        EXPECT_EQ(same.status, 0) << same;
    });
}

// The address was changed by hand, but not the router.
TEST_F(TavoctlStateOfABox, AStoredGatewayOutOfReachIsShownAndNotRefused)
{
    Box("here")->Do([] {
        for (const auto &[address, status] : {std::pair("192.0.2.10/24", 0), std::pair("198.51.100.10/24", 2)}) {
            json network = {{"format_version", 1}, {"gateway", "192.0.2.1"}};
            network["cards"] = json::array({{{"name", "eth0"}, {"address", address}}});
            const Ran ran = Apply(json{{"network", network}});
            EXPECT_EQ(ran.status, status) << ran;
        }
        test::ShellStatus("sed -i s/192[.]0[.]2[.]1$/203.0.113.1/ /etc/sysconfig/network");
        EXPECT_EQ(Shown().at("network").at("gateway"), "203.0.113.1");
        WriteFile(kFile, Tavoctl({"state", "show"}).out);
        const Ran differs = Tavoctl({"state", "diff", kFile});
        EXPECT_EQ(differs.status, 1) << differs;
        EXPECT_THAT(differs.out, testing::ContainsRegex("gateway +192.0.2.1 +203.0.113.1")) << "in use, and stored";
    });
}

TEST_F(TavoctlStateOfABox, AServiceWhoseVolumeIsAwayIsTheOnlyOneLeftOut)
{
    Box("here")->Do([] {
        const char *document = R"({"services": [
            {"name": "media", "enabled": true, "folders": ["/volume3/music", "/volume2/video", "/volume1/photo"]},
            {"name": "photo", "enabled": true, "folders": ["/volume3/photo"]},
            {"name": "ftp", "enabled": true}], "quotas": [{"user": "admin", "volume": 3, "limit_kib": 1024}]})";
        for (const Words &options : {Words{"--dry-run"}, Words()}) {
            const Ran ran = Apply(document, options);
            EXPECT_EQ(ran.status, 3) << ran;
            EXPECT_EQ(json::parse(ran.out).at("failed"), (json{"admin on /volume3", "service media", "service photo"}))
                << ran;
            EXPECT_EQ(json::parse(ran.out).at("changes").size(), 1u) << ran;
            EXPECT_THAT(ran.err, AllOf(HasSubstr("use the volume /volume3"), HasSubstr("find volume 3")));
        }
        EXPECT_EQ(test::Facts({"service", "status", "--json", "ftp"}).at("enabled"), true);
        EXPECT_EQ(test::Facts({"service", "status", "--json", "media"}).at("enabled"), false);
        const Ran off = Apply(R"({"services": [{"name": "media", "enabled": false, "folders": ["/volume1/music"]}]})");
        EXPECT_EQ(json::parse(off.out).at("changed"), false) << "a service that is off keeps no folders";
        // The first failure gives the exit status.
        EXPECT_EQ(Apply(R"({"quotas": [{"user": "admin", "volume": 1, "limit_kib": 1024}],
            "services": [{"name": "photo", "enabled": true, "folders": ["/volume3/photo"]}]})")
                      .status,
                  1);
    });
}

TEST_F(TavoctlState, ANewUserWithoutAHashIsLocked)
{
    const Ran ran =
        Apply(R"({"users": [{"name": "anna", "uid": 2001}], "groups": [{"name": "team", "members": ["ANNA"]}]})");
    EXPECT_EQ(ran.status, 0) << ran;
    EXPECT_EQ(json::parse(ran.out).at("locked"), json{"anna"});
    EXPECT_THAT(ran.err, HasSubstr("anna is locked"));
    const json anna = test::Facts({"user", "show", "--json", "anna"});
    EXPECT_EQ(anna.at("password"), "locked");
    EXPECT_EQ(anna.at("uid"), 2001);
    EXPECT_EQ(test::Facts({"group", "show", "--json", "team"}).at("members"), json{"anna"});
    EXPECT_EQ(Tavoctl({"user", "passwd", "anna"}, "secret\n").status, 0);
    const Ran again = Apply(R"({"users": [{"name": "anna", "password_hash": null}]})");
    EXPECT_EQ(json::parse(again.out).at("changed"), false) << again;
}

TEST_F(TavoctlState, RefusesBeforeTheFirstChange)
{
    ASSERT_EQ(Tavoctl({"user", "add", "holder", "--uid", "2001", "--unknown-password"}).status, 0);
    ASSERT_EQ(Tavoctl({"group", "add", "held", "--gid", "70000"}).status, 0);
    const std::string before = Files();
    const struct {
        const char *part;
        int status;
        const char *reason;
    } rows[] = {
        {R"("users": [{"name": "anna", "uid": 2001}])", 2, "that of holder"},
        {R"("users": [{"name": "anna"}, {"name": "ANNA"}])", 2, "duplicate name"},
        {R"("users": [{"name": "a:b"}])", 2, "ERR_INVALID_USERNAME"},
        {R"("users": [{"name": "anna", "password_hash": "$1$x"}])", 2, "some are missing"},
        {R"("users": [{"name": "anna", "password": "clear"}])", 2, "no field \"password\""},
        {R"("users": {"name": "anna"})", 2, "users: not a list"},
        {R"("groups": [{"name": "team", "gid": 70000}])", 2, "that of held"},
        {R"("groups": [{"name": "team", "members": ["nemo"]}])", 3, "nemo"},
        {R"("quotas": [{"user": "nemo", "volume": 1, "limit_kib": 1}])", 3, "nemo"},
        {R"("quotas": [{"user": "admin", "volume": -1, "limit_kib": 1}])", 2, "quotas[0].volume"},
        {R"("quotas": [{"user": "admin", "volume": 10000, "limit_kib": 1}])", 2, "quotas[0].volume"},
        {R"("quotas": [{"user": "admin", "volume": 1, "limit_kib": 1099511627777}])", 2, "quotas[0].limit_kib"},
        {R"("quotas": [{"user": "admin", "volume": 1, "limit_kib": 1.5}])", 2, "quotas[0].limit_kib"},
        {R"("network": {"format_version": 1, "cards": [{"name": "eth77", "mode": "dhcp"}]})", 2, "no such interface"},
        {R"("network": {})", 2, "format_version"},
        {R"("services": [{"name": "nothing"}])", 3, "none of that name"},
        {R"("services": [{"name": "media", "folders": ["/volume1/elsewhere"]}])", 2, "is at /volume1/elsewhere"},
        {R"("services": [{"name": "media", "folders": ["/root/music"]}])", 2, "not a folder on a volume"},
        {R"("services": [{"name": "crond", "enabled": true}])", 2, "services[0].enabled"},
        {R"("settings": {"more": 1})", 2, "settings.more"},
        {R"("settings": {"a=b": "c"})", 2, "set settings.a=b"},
        {R"("settings": {"key": "line\nline"})", 2, "set settings.key"},
        {R"("settings": {"runsamba": "no"})", 2, "belongs to the section services"},
        {R"("sittings": {})", 2, "no such section"},
        {R"("settings": {}, "settings": {})", 2, "duplicate field"},
    };
    for (const auto &row : rows) {
        // Parts that come first and are right.
        const std::string part = row.part;
        std::string text = "{\"format_version\": 1, " + part;
        if (part.find("settings") == part.npos)
            text += R"(, "settings": {"first": "yes"})";
        if (part.find("users") == part.npos)
            text += R"(, "users": [{"name": "first"}])";
        WriteFile(kFile, text + "}");
        for (const Words &words : {Words{"state", "apply", kFile}, Words{"state", "apply", "--dry-run", kFile}})
            test::IsRefused(words, row.reason, row.status);
        EXPECT_EQ(Files(), before) << row.part;
    }
    WriteFile(kFile, R"({"format_version": 2})");
    EXPECT_EQ(Tavoctl({"state", "diff", kFile}).status, 2);
}

TEST_F(TavoctlState, AccountsAreAllOrNothing)
{
    ASSERT_EQ(Tavoctl({"user", "add", "anna", "--uid", "2001", "--unknown-password"}).status, 0);
    ASSERT_EQ(Tavoctl({"conf", "set", "userHomeEnable", "yes"}).status, 0);
    std::filesystem::create_directories("/var/services/homes");
    ASSERT_EQ(::chmod("/etc/shadow", 0640), 0);
    const json before = Shown({"--only", "users,groups"});
    std::filesystem::remove("/usr/tavo/etc/private/smbpasswd");
    const auto files = [] {
        return test::Told(
            "cd /etc; stat -c '%n %a' passwd shadow group; cat passwd shadow group; ls /var/services/homes "
            "/usr/tavo/etc/private");
    };
    const std::string old_files = files();
    // The library notices the colon only when the others are done.
    const Ran ran = Apply(R"({"settings": {"first": "yes"}, "users": [{"name": "anna", "mail": "new@example.com"},
        {"name": "berta"}, {"name": "carla", "shell": "/bin:sh"}], "groups": [{"name": "team", "members": ["berta"]}]})");
    EXPECT_EQ(ran.status, 2) << ran;
    EXPECT_THAT(ran.err, AllOf(HasSubstr("the accounts are as they were"), HasSubstr("done before: settings")));
    EXPECT_EQ(files(), old_files);
    EXPECT_EQ(Shown({"--only", "users,groups"}), before);
    EXPECT_EQ(test::Facts({"user", "check", "--json"}).size(), 1u) << "the file that was missing";
    EXPECT_EQ(Tavoctl({"conf", "get", "first"}).out, "yes\n");
}

TEST_F(TavoctlState, OnlyTheSectionsThatWereAskedForAreTouched)
{
    const char *document = R"({"settings": {"first": "yes"}, "users": [{"name": "anna"}],
        "groups": [{"name": "team", "members": ["anna"]}]})";
    EXPECT_EQ(Apply(document, {"--only", "groups"}).status, 3) << "there is no anna";
    const Ran ran = Apply(document, {"--only", "users,groups"});
    EXPECT_EQ(ran.status, 0) << ran;
    EXPECT_EQ(Tavoctl({"conf", "get", "first"}).status, 3);
    // Where values are not quoted, blanks at the end are lost.
    WriteFile("/etc/tavoinfo.conf", "plain=yes\n");
    EXPECT_THAT(Apply(R"({"settings": {"key": "blanks  "}})").err, HasSubstr("settings.key: a settings file cannot"));
    EXPECT_EQ(ReadFile("/etc/tavoinfo.conf"), "plain=yes\n");
    ASSERT_NO_FATAL_FAILURE(test::PutDomainEntries(0));
    const json groups = Shown({"--only", "groups"});
    EXPECT_EQ(groups.size(), 1u) << groups;
    EXPECT_EQ(groups.at("groups"),
              json::parse(R"([{"name": "team", "gid": 65537, "description": "", "members": ["anna"]}])"))
        << "neither that to which all belong nor those of a domain";
    // Storage is compared, and nothing more.
    EXPECT_EQ(json::parse(Apply(R"({"storage": [{"name": "md9", "kind": "array"}]})").out).at("changed"), false);
    const Ran diff = Tavoctl({"state", "diff", "--noheadings", kFile});
    EXPECT_EQ(diff.status, 1) << diff;
    EXPECT_THAT(diff.out, testing::ContainsRegex("md9 +kind +- +array"));
}

}  // namespace
