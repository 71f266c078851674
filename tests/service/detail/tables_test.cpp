// The tables of the services, the page that prints them, and the parsers of the kernel's lists.
#include "service/detail/process_named.h"
#include "service/detail/service_table.h"
#include "service/detail/volume_list.h"
#include "support/test.h"

namespace {

constexpr const char *kPage =
#include "services_page.h"
    ;

std::string Code(const char *text)
{
    return text && *text ? "`" + std::string(text) + "`" : "-";
}

std::string BaseName(const char *path)
{
    return path ? std::string(path).substr(std::string(path).rfind('/') + 1) : "";
}

std::string Hex(uint32_t number)
{
    char text[16];
    std::snprintf(text, sizeof text, "0x%x", number);
    return text;
}

template <class Ids>
std::string Joined(const Ids &ids)
{
    std::string text;
    for (const int32_t id : ids)
        text += (text.empty() ? "" : ", ") + std::to_string(id);
    return text.empty() ? "-" : text;
}

std::string Capabilities(const tavo::ServiceShareRow &row)
{
    std::string text;
    for (const char *key : row.capability_keys) {
        if (key)
            text += (text.empty() ? "" : ", ") + Code(key);
    }
    return text.empty() ? "-" : text;
}

// Lines of the page that begin a row of a table: "| 7 | ...".
size_t RowsOfThePage()
{
    size_t count = 0;
    std::istringstream page(kPage);
    for (std::string line; std::getline(page, line);)
        count += line.size() > 2 && line.starts_with("| ") && line[2] >= '0' && line[2] <= '9';
    return count;
}

TEST(ServiceTables, ArePrintedInThePage)
{
    EXPECT_EQ(RowsOfThePage(), static_cast<size_t>(tavo::kServices + tavo::kServiceShares - 1));
    for (int id = 0; id < tavo::kServices; ++id) {
        const TAVOSERVICE &row = tavo::service_table[id];
        EXPECT_THAT(kPage, testing::HasSubstr("\n| " + std::to_string(id) + " | " + Code(row.szName) + " | " +
                                              Code(BaseName(row.szScript).c_str()) + " | " + Code(row.szKey) + " | " +
                                              Code(row.szProc) + " | " + Hex(row.fDaemon) + " | " +
                                              Joined(tavo::SharesOf(row)) + " |\n"));
    }
    constexpr const char *namings[] = {"@%s", "%s", "@database/%s"};
    for (int id = 1; id < tavo::kServiceShares; ++id) {
        const tavo::ServiceShareRow &whole = tavo::service_share_table[id];
        const TAVOSERVICESHARE &row = whole.share;
        EXPECT_THAT(kPage, testing::HasSubstr(
                               "\n| " + std::to_string(id) + " | " + Code(row.szShare) + " | " + Code(row.szLink) +
                               " | " + Code(row.szEnableKey) + " | " + (row.fSupported ? "yes" : "by the model") +
                               " | " + Code(namings[row.nNaming]) + " | " + std::to_string(row.nAttributeA) + ", " +
                               std::to_string(row.nAttributeB) + " | " + Capabilities(whole) + " |\n"));
    }
}

TEST(Volumes, ReadFromTheMounts)
{
    const auto volumes = tavo::VolumesIn(tavo::ParseMounts("proc /proc proc rw 0 0\n"
                                                           "/dev/vg1/lv2 /volume2 ext4 ro,relatime 0 0\n"
                                                           "/dev/md2 /volume1 ext4 rw 0 0\n"
                                                           "/dev/sdq1 /volumeUSB1/usbshare vfat rw 0 0\n"
                                                           "server:/export /volume10 nfs rw 0 0\n"
                                                           "/dev/md3 /volume2 ext4 rw,relatime 0 0\n"
                                                           "/dev/md4 /volume01 ext4 rw 0 0\n"
                                                           "/dev/md5 /volume1x ext4 rw 0 0\n"
                                                           "/dev/md6 /volume1/sub ext4 rw 0 0\n"
                                                           "short\n"));
    ASSERT_EQ(volumes.size(), 3u);
    EXPECT_EQ(volumes[0].path, "/volume1");
    EXPECT_TRUE(volumes[0].writable);
    EXPECT_EQ(tavo::KindOf(volumes[0]), tavo::kVolumeInternal);
    EXPECT_EQ(volumes[1].source, "/dev/md3") << "what was mounted last is what is seen";
    EXPECT_TRUE(volumes[1].writable);
    EXPECT_EQ(volumes[2].number, 10);
    EXPECT_EQ(tavo::KindOf(volumes[2]), tavo::kVolumeRemote);
    EXPECT_EQ(tavo::KindOf({1, "/volume1", "//host/share", "cifs", true}), tavo::kVolumeRemote);
    EXPECT_EQ(tavo::KindOf({1, "/volume1", "/dev/sdq1", "vfat", true}), tavo::kVolumeExternal);

    EXPECT_EQ(tavo::VolumeOf("/volume1/web"), "/volume1");
    EXPECT_EQ(tavo::VolumeOf("/volume12"), "/volume12");
    EXPECT_EQ(tavo::VolumeOf("/volume1x/web"), "");
    EXPECT_EQ(tavo::VolumeOf("/var/volume1"), "");
    EXPECT_EQ(tavo::VolumeOf(""), "");
}

TEST(ProcessNamed, TakesProgramsScriptsAndKernelThreads)
{
    const struct {
        const char *command;
        const char *name;
        bool found;
    } rows[] = {
        {"/usr/sbin/ftpd -D", "ftpd", true},
        {"ftpd: alice@10.0.0.9", "ftpd", true},
        {"/bin/sh /usr/sbin/ftpd", "ftpd", true},
        {"[nfsd]", "nfsd", true},
        {"[nfsd]", "[nfsd]", true},
        {"[nfsd4]", "nfsd", false},
        {"vi /etc/ftpd", "ftpd", false},
        {"/usr/sbin/vsftpd", "ftpd", false},
        {"grep nfsd", "nfsd", false},
        {"tavoctl service status crond", "crond", false},
        {"", "crond", false},
        {"/bin/nfsd", "[nfsd]", false},
    };
    for (const auto &row : rows)
        EXPECT_EQ(tavo::CommandHasName(row.command, row.name), row.found) << row.command;
}

}  // namespace
