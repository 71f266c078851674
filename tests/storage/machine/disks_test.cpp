// Real disks: found, asked and commanded.
#include "tavo_file.h"

#include "real_storage.h"
#include "support/captured_log.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <array>
#include <numeric>

#include <fcntl.h>
#include <syslog.h>

namespace {

using test::Disk;
using test::Told;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

using MachineDisks = test::LivedTest;

INSTANTIATE_TEST_SUITE_P(, MachineDisks, testing::ValuesIn(test::Lives()), test::LifeName);

constexpr uint64_t disk_bytes = 96u << 20;

std::vector<std::string> Enumerated()
{
    DISKLIST *list = nullptr;
    std::vector<std::string> paths;
    EXPECT_GE(DiskInfoEnum(nullptr, &list), 0);
    for (const DISKLIST *node = list; node; node = node->pNext)
        paths.emplace_back(node->pInfo->szPath);
    DiskInfoEnumFree(list);
    return paths;
}

TEST_P(MachineDisks, AreEnumeratedInTheOrderOfTheirBays)
{
    DISKLIST *list = nullptr;
    ASSERT_EQ(DiskInfoEnum(nullptr, &list), 6);
    int bay = 0;
    for (const DISKLIST *node = list; node; node = node->pNext) {
        const DISKINFO &info = *node->pInfo;
        ++bay;
        EXPECT_EQ(info.szPath, Disk(bay));
        EXPECT_EQ(info.iDisk, bay);
        EXPECT_THAT(info.szModel, StartsWith("NASLAB-HD-" + std::to_string(bay)));
        EXPECT_EQ(info.cbDisk, disk_bytes);
        EXPECT_EQ(info.nTemperature, -1) << "these drives have attribute 190, and no 194";
        int container = 0;
        EXPECT_EQ(DiskContainerGet(info.szPath, &container), 0);
        EXPECT_EQ(container, DISK_CONTAINER_INTERNAL);
    }
    DiskInfoEnumFree(list);
}

TEST_P(MachineDisks, ReportsAnEmptyBayWithoutFailure)
{
    test::Happen("pull 3");
    {
        const test::CapturedLog log;
        EXPECT_THAT(Enumerated(), ElementsAre("/dev/sda", "/dev/sdb", "/dev/sdd", "/dev/sde", "/dev/sdf"));
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

    unsigned char power = 0;
    EXPECT_EQ(ata_command_interface(fd, DISK_COMMAND_CHECK_POWER, &power), 0);
    EXPECT_EQ(power, 0xFF);
    power = 0;
    EXPECT_EQ(marvell_command_interface(fd, DISK_COMMAND_CHECK_POWER, &power), 0);
    EXPECT_EQ(power, 0xFF);
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

TEST_P(MachineDisks, PowerIsAskedAndChanged)
{
    unsigned char state = 0;
    EXPECT_EQ(TAVOIDiskCheckPower("/dev/sda", &state), 0);
    EXPECT_NE(state, 0);
    EXPECT_EQ(TAVOIDiskFlushBuffer("/dev/sda"), 0);
    EXPECT_EQ(TAVOIDiskSetDiskStandby("/dev/sda"), 0);
    EXPECT_EQ(TAVODiskSetStandbySeconds(60), 0);
    EXPECT_EQ(TAVODiskSetStandbyTimer(30), 0);
    int minutes = 0;
    EXPECT_EQ(TAVODiskGetStandbyTimer(&minutes), 0);
    EXPECT_EQ(minutes, 30);
    EXPECT_EQ(TAVODiskSetStandbyTimer(25), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_BAD_PARAMETERS);
    EXPECT_EQ(TAVODiskGetFileSBTimerSetting(), 30);

    EXPECT_EQ(TAVOIDiskRawOpen("/dev/null"), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_NOT_A_DISK);
    EXPECT_EQ(TAVOIDiskCheckPower("/dev/sdz", &state), -1);
    EXPECT_EQ(TLIBErrGet(), ERR_OPEN_RAWDEVICE);
}

TEST_P(MachineDisks, RecognisesAStickWithoutATable)
{
    EXPECT_EQ(TAVOIsUSBDiskFATNoPartition("/dev/sdd"), 0);
    // The first sector of a FAT16 file system.
    Told("{ printf '\\353\\074\\220'; head -c 51 /dev/zero; printf 'FAT16   '; head -c 448 /dev/zero; "
         "printf '\\125\\252'; } >/tmp/sector && dd if=/tmp/sector of=/dev/sdd conv=notrunc,fsync bs=512 count=1");
    EXPECT_EQ(TAVOIsUSBDiskFATNoPartition("/dev/sdd"), 1);
}

}  // namespace
