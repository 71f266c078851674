// What is sent to a drive, byte for byte and in which order.
#include "tavo_disk.h"

#include "storage/storage_scene.h"
#include "support/appliance_root.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <set>

#include <fcntl.h>
#include <linux/fs.h>
#include <linux/hdreg.h>
#include <scsi/sg.h>
#include <unistd.h>

using test::Fault;
using test::LastFault;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

std::string Hex(const unsigned char *bytes, size_t count)
{
    std::string text;
    for (size_t i = 0; i < count; ++i) {
        char two[4];
        std::snprintf(two, sizeof two, "%s%02x", i ? " " : "", bytes[i]);
        text += two;
    }
    return text;
}

// Stands in for the drives: records each request of the kernel's interface, answers it, and fails those that the test
// names.
class Drives : public test::StorageScene {
  protected:
    Drives()
    {
        calls_.OnIoctl([this](int, unsigned long request, void *argument) { return Answer(request, argument); });
        Add("sda", 0);
    }

    void Add(const std::string &name, unsigned minor, bool marvell = false)
    {
        tree_.AddDisk("/dev/" + name, 8, minor);
        tree_.Put("/sys/block/" + name + "/size", "1\n");
        tree_.Link("/sys/block/" + name + "/device",
                   marvell ? "../../devices/platform/host0/0:0:0:0" : "../../../0:0:0:0");
    }

    int Answer(unsigned long request, void *argument)
    {
        unsigned char *const data = static_cast<unsigned char *>(argument);
        std::string note;
        switch (request) {
        case HDIO_DRIVE_CMD:
            note = data ? "cmd " + Hex(data, 4) : "cmd none";
            break;
        case HDIO_GET_IDENTITY:
            if (packet_device_)
                data[1] = 0x80;
            return 0;
        case HDIO_DRIVE_RESET:
            note = "reset";
            break;
        case HDIO_SET_DMA:
            note = "dma " + std::to_string(reinterpret_cast<intptr_t>(argument));
            break;
        case BLKFLSBUF:
            note = "blkflsbuf";
            break;
        case SG_IO: {
            const sg_io_hdr_t &scsi = *static_cast<sg_io_hdr_t *>(argument);
            note = "scsi " + Hex(scsi.cmdp, scsi.cmd_len);
            EXPECT_EQ(scsi.timeout, 60000u);
            break;
        }
        }
        calls_.Note(note);
        if (fail_.count(note)) {
            errno = fail_errno_;
            return -1;
        }
        if (request == HDIO_DRIVE_CMD && data)
            Fill(data);
        if (request == SG_IO)
            FillScsi(*static_cast<sg_io_hdr_t *>(argument));
        return 0;
    }

    void Fill(unsigned char *data)
    {
        if (data[0] == 0xE5)
            data[2] = power_;
        else if (data[3] == 1)
            std::memcpy(data + 4, page_, sizeof page_);
    }

    void FillScsi(sg_io_hdr_t &scsi)
    {
        if (scsi.dxfer_direction == SG_DXFER_TO_DEV) {
            const unsigned char *const bytes = static_cast<unsigned char *>(scsi.dxferp);
            calls_.Note("data " + Hex(bytes, scsi.dxfer_len));
        } else if (scsi.cmdp[0] == 0x1A) {
            std::memcpy(scsi.dxferp, mode_data_.data(), std::min<size_t>(mode_data_.size(), scsi.dxfer_len));
        } else if (scsi.cmdp[0] == 0x85) {
            scsi.status = 2;
            scsi.sbp[0] = 0x72, scsi.sbp[1] = 1, scsi.sbp[8] = 9, scsi.sbp[13] = power_, scsi.sbp[21] = 0x50;
            if (scsi.dxfer_len) {
                scsi.status = 0;
                std::memcpy(scsi.dxferp, page_, sizeof page_);
            }
        }
    }

    std::set<std::string> fail_;
    int fail_errno_ = EIO;
    bool packet_device_ = false;
    unsigned char power_ = 0xFF;
    unsigned char page_[512] = {};
    std::vector<unsigned char> mode_data_;
};

TEST_F(Drives, CommandsOfTheAtaInterface)
{
    const struct {
        int command;
        const char *sent;
        bool page;
    } rows[] = {
        {0, "cmd b0 01 d8 00", false}, {1, "cmd b0 00 d0 01", true},  {2, "cmd b0 01 d1 01", true},
        {3, "cmd b0 06 d5 01", true},  {4, "cmd e5 00 00 00", false}, {6, "cmd e0 00 00 00", false},
        {7, "cmd ec 01 00 01", true},  {8, "cmd a1 01 00 01", true},  {9, "cmd none", false},
    };
    page_[511] = 0x77;
    for (const auto &row : rows) {
        unsigned char data[513] = {};
        data[512] = 0x5A;
        EXPECT_EQ(ata_command_interface(3, row.command, data), 0) << row.command;
        EXPECT_THAT(calls_.Take(), ElementsAre(row.sent)) << row.command;
        EXPECT_EQ(data[511], row.page ? 0x77 : 0) << row.command;
        EXPECT_EQ(data[512], 0x5A);
    }
    packet_device_ = true;
    unsigned char data[512];
    EXPECT_EQ(ata_command_interface(3, 7, data), 0);
    EXPECT_EQ(ata_command_interface(3, 8, data), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd a1 01 00 01", "cmd ec 01 00 01")) << "a packet device has them swapped";

    for (const int command : {-1, 5, 10, 1000})
        EXPECT_EQ(ata_command_interface(3, command, data), -1) << command;
    EXPECT_EQ(ata_command_interface(3, 1, nullptr), -1);
    EXPECT_THAT(calls_.Take(), IsEmpty());
    EXPECT_THAT(log_.Lines(), IsEmpty());

    fail_ = {"cmd none", "cmd e0 00 00 00"};
    fail_errno_ = EINVAL;
    EXPECT_EQ(ata_command_interface(3, 9, nullptr), 0) << "what a kernel without this command answers";
    EXPECT_EQ(ata_command_interface(3, 6, nullptr), -1);
    fail_errno_ = EIO;
    EXPECT_EQ(ata_command_interface(3, 9, nullptr), -1);
    EXPECT_EQ(log_.Take(), "smartctl_ata_command_interface:# ata ioctl HDIO_DRIVE_CMD error \n\n"
                           "smartctl_ata_command_interface:# ata ioctl HDIO_DRIVE_CMD error \n");
}

TEST_F(Drives, CommandsOfTheOtherInterface)
{
    const struct {
        int command;
        const char *sent;
    } rows[] = {
        {0, "scsi 85 06 20 00 d8 00 00 00 01 00 4f 00 c2 00 b0 00"},
        {1, "scsi 85 08 0e 00 d0 00 01 00 00 00 4f 00 c2 00 b0 00"},
        {4, "scsi 85 06 20 00 00 00 00 00 00 00 00 00 00 00 e5 00"},
        {5, "scsi 85 06 20 00 00 00 fb 00 00 00 00 00 00 00 e3 00"},
        {6, "scsi 85 06 20 00 00 00 00 00 00 00 00 00 00 00 e0 00"},
        {7, "scsi 85 08 0e 00 00 00 01 00 00 00 00 00 00 00 ec 00"},
        {9, "scsi 85 06 20 00 00 00 00 00 00 00 00 00 00 00 e7 00"},
    };
    for (const auto &row : rows) {
        unsigned char data[512] = {0xFB};
        EXPECT_EQ(marvell_command_interface(3, row.command, data), 0) << row.command;
        EXPECT_THAT(calls_.Take(), ElementsAre(row.sent)) << row.command;
    }
    unsigned char state = 1;
    power_ = 0;
    EXPECT_EQ(marvell_command_interface(3, 4, &state), 0);
    EXPECT_EQ(state, 0);
    EXPECT_EQ(marvell_command_interface(3, 10, &state), -1);
}

TEST_F(Drives, RawOpenTakesDisksOnly)
{
    const struct {
        unsigned major;
        int code;
    } rows[] = {{8, 0},
                {3, 0},
                {71, 0},
                {72, ERR_NOT_A_DISK},
                {128, 0},
                {136, ERR_NOT_A_DISK},
                {9, ERR_NOT_A_DISK},
                {259, ERR_NOT_A_DISK}};
    for (const auto &row : rows) {
        tree_.Remove("/dev/sdb");
        tree_.AddDisk("/dev/sdb", row.major, 0);
        test::ForgetFault();
        const int fd = TAVOIDiskRawOpen("/dev/sdb");
        EXPECT_EQ(fd >= 0, row.code == 0) << row.major;
        EXPECT_EQ(LastFault(), (row.code ? Fault{row.code, "disk_raw_open"} : Fault{})) << row.major;
        if (fd >= 0) {
            EXPECT_EQ(::fcntl(fd, F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
            ::close(fd);
        }
    }
    tree_.Put("/dev/sdc", "a file");
    EXPECT_EQ(TAVOIDiskRawOpen("/dev/sdc"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_NOT_A_DISK, "disk_raw_open"}));
    EXPECT_EQ(TAVOIDiskRawOpen("/dev/sdq"), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_RAWDEVICE, "disk_raw_open"}));
    EXPECT_EQ(TAVOIDiskCheckPower("/dev/sdq", &power_), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_RAWDEVICE, "disk_check_power"}));
    EXPECT_THAT(calls_.Take(), IsEmpty()) << "nothing was sent to what is no disk";
}

TEST_F(Drives, StandbyLeavesSleepersAlone)
{
    power_ = 0;
    EXPECT_EQ(TAVOIDiskSetDiskStandby("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e5 00 00 00"));
    power_ = 0xFF;
    EXPECT_EQ(TAVOIDiskSetDiskStandby("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e5 00 00 00", "cmd e0 00 00 00"));
    fail_ = {"cmd e5 00 00 00"};
    EXPECT_EQ(TAVOIDiskSetDiskStandby("/dev/sda"), -1);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e5 00 00 00"));
    log_.Clear();
    EXPECT_EQ(TAVOIDiskSetDiskStandby(nullptr), -1);
    EXPECT_EQ(log_.Take(), "disk_set_disk_standby:# argument should not be NULL");
}

TEST_F(Drives, FlushesInOrder)
{
    EXPECT_EQ(TAVOIDiskFlushBuffer("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(),
                ElementsAre("sync", "fsync", "fdatasync", "sync", "blkflsbuf", "sync", "cmd none", "sync"));
    fail_ = {"blkflsbuf"};
    EXPECT_EQ(TAVOIDiskFlushBuffer("/dev/sda"), -1);
    EXPECT_THAT(calls_.Take(), ElementsAre("sync", "fsync", "fdatasync", "sync", "blkflsbuf"));
    EXPECT_EQ(log_.Take(), "disk_flush_buffer:# ioctl(fd, BLKFLSBUF, NULL) fail");
}

TEST_F(Drives, SleepAndReset)
{
    EXPECT_EQ(TAVOIDiskEnterSleep("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e7 00 00 00", "cmd e6 00 00 00"));
    fail_ = {"cmd e6 00 00 00"};
    EXPECT_EQ(TAVOIDiskEnterSleep("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e7 00 00 00", "cmd e6 00 00 00", "cmd 99 00 00 00"));
    fail_.insert("cmd 99 00 00 00");
    EXPECT_EQ(TAVOIDiskEnterSleep("/dev/sda"), -1);

    calls_.Clear();
    EXPECT_EQ(TAVOIDiskReset("/dev/sda"), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("reset", "sleep 10", "dma 1"));
    fail_ = {"reset"};
    EXPECT_NE(TAVOIDiskReset("/dev/sda"), 0);
    fail_ = {"dma 1"};
    EXPECT_NE(TAVOIDiskReset("/dev/sda"), 0);
}

TEST_F(Drives, AllInStandby)
{
    Add("sdb", 16);
    Add("sdk", 160);
    tree_.Put("/dev/sdc", "no disk");
    fail_ = {"blkflsbuf"};
    test::ForgetFault();
    EXPECT_EQ(TAVODiskSetStandby(), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("sync", "fsync", "fdatasync", "sync", "blkflsbuf",  // of sda
                                           "sync", "fsync", "fdatasync", "sync", "blkflsbuf",  // of sdb
                                           "sync", "sleep 10", "cmd e5 00 00 00", "cmd e0 00 00 00", "cmd e5 00 00 00",
                                           "cmd e0 00 00 00"));
    EXPECT_THAT(log_.Take(),
                HasSubstr("disk_set_standby:# TAVOIDiskFlushBuffer(/dev/sdb) fail, but still issue standby"));
    EXPECT_EQ(LastFault(), Fault{}) << "empty bays are no failure";
    fail_ = {"cmd e0 00 00 00"};
    EXPECT_NE(TAVODiskSetStandby(), 0);
}

TEST_F(Drives, TimerOfOneDisk)
{
    Add("sdb", 16, true);
    EXPECT_EQ(TAVOIDiskSetDiskStandbyTimer("/dev/sda", 0xFB), 0);
    EXPECT_EQ(TAVOIDiskSetDiskStandbyTimer("/dev/sdb", 0xFB), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e3 fb 00 00", "scsi 85 06 20 00 00 00 fb 00 00 00 00 00 00 00 e3 00"));
}

TEST_F(Drives, TimerBySeconds)
{
    const struct {
        int seconds;
        const char *sent;  // NULL: refused
    } rows[] = {{1, "cmd e3 01 00 00"},    {5, "cmd e3 01 00 00"}, {6, "cmd e3 02 00 00"}, {1200, "cmd e3 f0 00 00"},
                {1196, "cmd e3 f0 00 00"}, {0, nullptr},           {-5, nullptr},          {1201, nullptr},
                {2147483647, nullptr}};
    for (const auto &row : rows) {
        EXPECT_EQ(TAVODiskSetStandbySeconds(row.seconds), row.sent ? 0 : -1) << row.seconds;
        EXPECT_EQ(calls_.Take(), row.sent ? std::vector<std::string>{row.sent} : std::vector<std::string>());
        if (!row.sent) {
            EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "disk_set_standby_seconds"}));
        }
    }
}

TEST_F(Drives, TimerByMinutesIsSaved)
{
    if (test::RootForm().empty())
        GTEST_SKIP() << "changes the system settings: only in an appliance root";
    test::WriteFile("/etc/tavoinfo.conf", "runsamba=\"yes\"\n");
    int minutes = 77;
    EXPECT_EQ(TAVODiskGetStandbyTimer(&minutes), -1);
    EXPECT_EQ(minutes, 77);
    for (const int accepted : {1, 20, 21, 30, 330, 480, 0}) {
        EXPECT_EQ(TAVODiskSetStandbyTimer(accepted), 0) << accepted;
        EXPECT_THAT(calls_.Take(), testing::Contains(accepted ? "cmd e3 fb 00 00" : "cmd e3 00 00 00")) << accepted;
        EXPECT_EQ(TAVODiskGetStandbyTimer(&minutes), 0);
        EXPECT_EQ(minutes, accepted);
    }
    for (const int refused : {-1, 22, 25, 45, 360, 479, 481}) {
        EXPECT_EQ(TAVODiskSetStandbyTimer(refused), -1) << refused;
        EXPECT_EQ(LastFault(), (Fault{ERR_BAD_PARAMETERS, "disk_set_standby_timer"})) << refused;
    }
    EXPECT_THAT(calls_.Take(), IsEmpty());
    EXPECT_EQ(TAVODiskSetStandbyTimer(0), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd e3 00 00 00")) << "what is saved already is not written again";
    Add("sdb", 16);
    fail_ = {"cmd e3 fb 00 00"};
    EXPECT_EQ(TAVODiskSetStandbyTimer(30), -1);
    EXPECT_EQ(TAVODiskGetFileSBTimerSetting(), 0) << "a drive that refused: nothing is saved";
    EXPECT_EQ(test::ReadFile("/etc/tavoinfo.conf"), "runsamba=\"yes\"\nstandbytimer=0\n");
}

TEST_F(Drives, WriteCacheOfAtaDisks)
{
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sda"), 0);
    page_[85 * 2] = 1 << 5;
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sda"), 1);
    fail_ = {"cmd ec 01 00 01"};
    calls_.Clear();
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sda"), 1);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd ec 01 00 01", "cmd a1 01 00 01"));
    fail_.insert("cmd a1 01 00 01");
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sda"), 0);
    EXPECT_THAT(log_.Take(), HasSubstr("/dev/sda HDIO_DRIVE_CMD(identify) failed"));
    calls_.Clear();
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sda", 1), 0);
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sda", 0), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd ef 00 02 00", "cmd ef 00 82 00"));
    fail_ = {"cmd ef 00 82 00"};
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sda", 0), -1);
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sdq", 0), -1);
    EXPECT_EQ(LastFault(), (Fault{ERR_OPEN_RAWDEVICE, "disk_write_cache_set"}));
}

TEST_F(Drives, WriteCacheOfDisksOnTheOtherInterface)
{
    Add("sdb", 16, true);
    mode_data_ = {23, 0, 0x10, 0, 0x88, 18, 0x04};
    mode_data_.resize(24);
    const std::string sense = "scsi 1a 00 08 00 c0 00";
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sdb"), 1);
    EXPECT_THAT(calls_.Take(), ElementsAre(sense));
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sdb", 1), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre(sense)) << "it is on already";
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sdb", 0), 0);
    std::string rest;
    for (int i = 0; i < 17; ++i)
        rest += " 00";
    EXPECT_THAT(calls_.Take(), ElementsAre(sense, "scsi 15 10 00 00 18 00", "data 00 00 00 00 08 12 00" + rest));
    mode_data_[5] = 200;
    EXPECT_EQ(TAVODiskWriteCacheGet("/dev/sdb"), 0);
    EXPECT_EQ(TAVODiskWriteCacheSet("/dev/sdb", 1), -1) << "no page, no writing";
}

TEST_F(Drives, SmartData)
{
    page_[2] = 194, page_[7] = 41;
    unsigned char page[512] = {};
    EXPECT_EQ(SmartDataRead("/dev/sda", page, 0), 0);
    EXPECT_EQ(page[7], 41);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd b0 00 d0 01"));
    EXPECT_EQ(TAVODiskTemperatureGet("/dev/sda"), 41);
    EXPECT_EQ(TAVODiskTemperatureC("/dev/sda"), 41);

    calls_.Clear();
    std::memset(page, 0x5A, sizeof page);
    EXPECT_EQ(SmartDataRead("/dev/sda", page, 1), -1);
    EXPECT_EQ(page[7], 0x5A) << "a page with a wrong sum is not handed out";
    EXPECT_EQ(log_.Take(), "smart_data_read:# Wrong checksum of the SMART data of /dev/sda");
    page_[511] = static_cast<unsigned char>(-194 - 41);
    EXPECT_EQ(SmartDataRead("/dev/sda", page, 1), 0);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd b0 00 d0 01", "cmd b0 01 d1 01", "cmd b0 00 d0 01", "cmd b0 01 d1 01"));

    fail_ = {"cmd b0 00 d0 01"};
    EXPECT_EQ(SmartDataRead("/dev/sda", page, 0), -1);
    EXPECT_THAT(calls_.Take(), ElementsAre("cmd b0 00 d0 01", "cmd b0 01 d8 00", "cmd b0 00 d0 01"));
    log_.Clear();
    EXPECT_EQ(TAVODiskTemperatureGet("/dev/sda"), -1);
    EXPECT_THAT(log_.Take(), HasSubstr("disk_temperature_get(#) read value /dev/sda fail"));
    EXPECT_EQ(TAVODiskTemperatureC("/dev/sda"), -1);
    EXPECT_THAT(log_.Take(), HasSubstr("disk_temperature_c(#)Failed to get status of RAID Temperature"));
}

TEST_F(Drives, SolidStateAndSticks)
{
    EXPECT_EQ(TAVODiskIsSSD("/dev/sda"), 0);
    page_[83 * 2 + 1] = 0x40;
    EXPECT_EQ(TAVODiskIsSSD("/dev/sda"), 1);
    fail_ = {"cmd ec 01 00 01"};
    EXPECT_EQ(TAVODiskIsSSD("/dev/sda"), -1);

    std::string sector(512, 0);
    sector.replace(0, 3, "\xEB\x58\x90");
    sector.replace(82, 5, "FAT32");
    sector.replace(510, 2, "\x55\xAA");
    tree_.Put("/dev/sdk", sector);
    EXPECT_EQ(TAVOIsUSBDiskFATNoPartition("/dev/sdk"), 1);
    tree_.Put("/dev/sdk", sector.substr(0, 511));
    EXPECT_EQ(TAVOIsUSBDiskFATNoPartition("/dev/sdk"), 0);
    EXPECT_EQ(TAVOIsUSBDiskFATNoPartition(nullptr), 0);
}

}  // namespace
