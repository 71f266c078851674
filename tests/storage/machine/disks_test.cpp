// Real disks: found, asked and commanded.
#include "real_storage.h"
#include "support/captured_log.h"

#include <gmock/gmock.h>

#include <array>
#include <numeric>
#include <sstream>

#include <fcntl.h>

namespace {

using test::Disk;
using test::Told;
using testing::HasSubstr;
using testing::StartsWith;

using MachineDisks = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachineDisks, testing::ValuesIn(test::Lives()), test::LifeName);

constexpr uint64_t disk_bytes = 96u << 20;

// Path, bay, model, bytes, temperature and container of each.
std::vector<std::string> Enumerated()
{
    DISKLIST *list = nullptr;
    std::vector<std::string> disks;
    EXPECT_GE(DiskInfoEnum(nullptr, &list), 0);
    for (const DISKLIST *node = list; node; node = node->pNext) {
        const DISKINFO &info = *node->pInfo;
        int container = 0;
        EXPECT_EQ(DiskContainerGet(info.szPath, &container), 0);
        std::ostringstream text;
        text << info.szPath << " " << info.iDisk << " " << std::string_view(info.szModel).substr(0, 11) << " "
             << info.cbDisk << " " << info.nTemperature << " " << container;
        disks.push_back(text.str());
    }
    DiskInfoEnumFree(list);
    return disks;
}

TEST_P(MachineDisks, AreEnumeratedInTheOrderOfTheirBays)
{
    std::vector<std::string> expected;
    for (int bay = 1; bay <= 6; ++bay) {
        const std::string number = std::to_string(bay);
        // These drives have attribute 190, and no 194.
        expected.push_back(Disk(bay) + " " + number + " NASLAB-HD-" + number + " " + std::to_string(disk_bytes) +
                           " -1 " + std::to_string(DISK_CONTAINER_INTERNAL));
    }
    EXPECT_EQ(Enumerated(), expected);
    test::Happen("pull 3");
    expected.erase(expected.begin() + 2);
    {
        const test::CapturedLog log;
        EXPECT_EQ(Enumerated(), expected);
        EXPECT_THAT(log.Texts(), testing::Each(testing::Not(HasSubstr("sdc"))));
    }
    test::Happen("plug 3");
    EXPECT_EQ(Enumerated().size(), 6u);
    EXPECT_EQ(DiskIsExist("/dev/sdc"), 1);
}

TEST_P(MachineDisks, NumbersAndSummariesAgreeWithTheKernel)
{
    int32_t *numbers = nullptr;
    const int count = TAVODiskEnum(1, &numbers);
    ASSERT_EQ(count, 6);
    for (int i = 0; i < count; ++i) {
        TAVODISKINFO *info = nullptr;
        ASSERT_EQ(TAVODiskGetInfo(1, numbers[i], &info), 0);
        EXPECT_EQ(info->cMibDisk, disk_bytes >> 20);
        EXPECT_EQ(Told("cat /sys/block/" + std::string(info->szName) + "/dev"),
                  std::to_string(numbers[i] / 256) + ":" + std::to_string(numbers[i] % 256) + "\n");
        std::free(info);
    }
    std::free(numbers);
    const int fd = ::open("/dev/sdd", O_RDONLY | O_CLOEXEC);
    char *name = TAVODiskGetDevnameFromFd(fd);
    EXPECT_STREQ(name, "/dev/sdd");
    std::free(name);
    ::close(fd);
}

// The way through SG_IO must give what the way through HDIO_DRIVE_CMD gives, and that is what the real tools say.
TEST_P(MachineDisks, BothCommandInterfacesReachTheDrive)
{
    const int fd = TAVOIDiskRawOpen("/dev/sdb");
    ASSERT_GE(fd, 0);
    for (const int command : {DISK_COMMAND_SMART_ENABLE, DISK_COMMAND_STANDBY, DISK_COMMAND_FLUSH}) {
        EXPECT_EQ(ata_command_interface(fd, command, nullptr), 0) << command;
        EXPECT_EQ(marvell_command_interface(fd, command, nullptr), 0) << command;
    }
    for (const int command :
         {DISK_COMMAND_IDENTIFY, DISK_COMMAND_SMART_DATA, DISK_COMMAND_SMART_THRESHOLDS, DISK_COMMAND_SMART_SELFTEST}) {
        std::array<unsigned char, 512> by_ata = {};
        std::array<unsigned char, 512> by_scsi = {};
        EXPECT_EQ(ata_command_interface(fd, command, by_ata.data()), 0) << command;
        EXPECT_EQ(marvell_command_interface(fd, command, by_scsi.data()), 0) << command;
        EXPECT_EQ(by_ata, by_scsi) << command;
        EXPECT_GT(std::accumulate(by_ata.begin(), by_ata.end(), 0), 0) << command;
    }
    unsigned char identity[512] = {};
    EXPECT_EQ(marvell_command_interface(fd, DISK_COMMAND_IDENTIFY, identity), 0);
    std::string serial;
    for (int i = 20; i < 40; i += 2)
        serial += {static_cast<char>(identity[i + 1]), static_cast<char>(identity[i])};
    EXPECT_THAT(Told("hdparm -i /dev/sdb"), HasSubstr("SerialNo=" + serial.substr(0, 6)));
    EXPECT_THAT(serial, StartsWith("SN0002"));

    for (const auto command : {ata_command_interface, marvell_command_interface}) {
        unsigned char power = 0;
        EXPECT_EQ(command(fd, DISK_COMMAND_CHECK_POWER, &power), 0);
        EXPECT_EQ(power, 0xFF);
    }
    unsigned char timer = 12;
    EXPECT_EQ(ata_command_interface(fd, DISK_COMMAND_SET_TIMER, &timer), -1);
    EXPECT_EQ(marvell_command_interface(fd, DISK_COMMAND_SET_TIMER, &timer), 0);
    ::close(fd);
}

TEST_P(MachineDisks, SmartPageIsWhatTheRealToolReads)
{
    unsigned char page[512] = {};
    ASSERT_EQ(SmartDataRead("/dev/sda", page, 1), 0);
    EXPECT_EQ(std::accumulate(page, page + 512, 0) % 256, 0);
    std::string ids;
    for (int i = 0; i < 30; ++i) {
        if (page[2 + 12 * i])
            ids += std::to_string(page[2 + 12 * i]) + "\n";
    }
    EXPECT_EQ(Told("smartctl -A /dev/sda | awk '/^ *[0-9]+ [A-Z]/ { print $1 }'"), ids);
    EXPECT_EQ(TAVODiskTemperatureGet("/dev/sda"), -1);
}

TEST_P(MachineDisks, WriteCacheGoesOffAndOn)
{
    for (const int wanted : {0, 1, 1, 0, 1}) {
        EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sdc", wanted), 0);
        EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sdc"), wanted);
        EXPECT_THAT(Told("hdparm -W /dev/sdc"), HasSubstr(wanted ? "1 (on)" : "0 (off)"));
    }
}

}  // namespace
