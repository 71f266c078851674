// What is sent to a drive, byte for byte and in which order.
#include "tavo_disk.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <linux/fs.h>
#include <linux/hdreg.h>
#include <scsi/sg.h>

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
class Drives : public test::StorageStory {
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
    page_[511] = 0x77;
    for (const int command : {0, 1, 2, 3, 4, 6, 7, 8, 9, -1, 5, 10, 1000}) {
        unsigned char data[513] = {};
        data[512] = 0x5A;
        story_.Head("command " + std::to_string(command));
        TELL(ata_command_interface(3, command, data));
        story_.Show("last byte", data[511]);
        EXPECT_EQ(data[512], 0x5A);
    }
    // A packet device has them swapped.
    packet_device_ = true;
    unsigned char data[512];
    TELL(ata_command_interface(3, 7, data));
    TELL(ata_command_interface(3, 8, data));
    for (const int command : {1, 4, 5, 7, 9})
        TELL(ata_command_interface(3, command, nullptr));
    // What a kernel without this command answers.
    fail_ = {"cmd none", "cmd e0 00 00 00"};
    fail_errno_ = EINVAL;
    TELL(ata_command_interface(3, 9, nullptr));
    TELL(ata_command_interface(3, 6, nullptr));
    fail_errno_ = EIO;
    TELL(ata_command_interface(3, 9, nullptr));
}

TEST_F(Drives, CommandsOfTheOtherInterface)
{
    for (const int command : {0, 1, 4, 5, 6, 7, 9, 10}) {
        unsigned char data[512] = {0xFB};
        story_.Head("command " + std::to_string(command));
        TELL(marvell_command_interface(3, command, data));
    }
    for (const int command : {1, 4, 5, 7, 9})
        TELL(marvell_command_interface(3, command, nullptr));
    unsigned char state = 1;
    power_ = 0;
    EXPECT_EQ(marvell_command_interface(3, 4, &state), 0);
    EXPECT_EQ(state, 0);
    fail_ = {"scsi 85 06 20 00 00 00 00 00 00 00 00 00 00 00 e7 00"};
    TELL(marvell_command_interface(3, 9, nullptr));
}

TEST_F(Drives, RawOpenTakesDisksOnly)
{
    for (const unsigned major : {8, 3, 71, 72, 128, 136, 9, 259}) {
        tree_.Remove("/dev/sdb");
        tree_.AddDisk("/dev/sdb", major, 0);
        int fd = -1;
        story_.Head("major number " + std::to_string(major));
        TELL((fd = TAVOIDiskRawOpen("/dev/sdb")) >= 0);
        if (fd >= 0) {
            EXPECT_EQ(::fcntl(fd, F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
            ::close(fd);
        }
    }
    tree_.Put("/dev/sdc", "a file");
    TELL(TAVOIDiskRawOpen("/dev/sdc"));
    TELL(TAVOIDiskRawOpen("/dev/sdq"));
    TELL(TAVOIDiskCheckPower("/dev/sdq", &power_));
}

TEST_F(Drives, StandbyLeavesSleepersAlone)
{
    power_ = 0;
    TELL(TAVOIDiskSetDiskStandby("/dev/sda"));
    power_ = 0xFF;
    TELL(TAVOIDiskSetDiskStandby("/dev/sda"));
    fail_ = {"cmd e5 00 00 00"};
    TELL(TAVOIDiskSetDiskStandby("/dev/sda"));
    TELL(TAVOIDiskSetDiskStandby(nullptr));
}

TEST_F(Drives, FlushesInOrder)
{
    TELL(TAVOIDiskFlushBuffer("/dev/sda"));
    fail_ = {"blkflsbuf"};
    TELL(TAVOIDiskFlushBuffer("/dev/sda"));
}

TEST_F(Drives, SleepAndReset)
{
    TELL(TAVOIDiskEnterSleep("/dev/sda"));
    fail_ = {"cmd e6 00 00 00"};
    TELL(TAVOIDiskEnterSleep("/dev/sda"));
    fail_.insert("cmd 99 00 00 00");
    TELL(TAVOIDiskEnterSleep("/dev/sda"));
    for (const char *failing : {"", "reset", "dma 1"}) {
        fail_ = {failing};
        TELL(TAVOIDiskReset("/dev/sda"));
    }
}

TEST_F(Drives, AllInStandby)
{
    Add("sdb", 16);
    Add("sdk", 160);
    tree_.Put("/dev/sdc", "no disk");
    fail_ = {"blkflsbuf"};
    TELL(TAVODiskSetStandby());  // empty bays are not a failure
    fail_ = {"cmd e0 00 00 00"};
    TELL(TAVODiskSetStandby());
}

TEST_F(Drives, TimerOfOneDisk)
{
    Add("sdb", 16, true);
    TELL(TAVOIDiskSetDiskStandbyTimer("/dev/sda", 0xFB));
    TELL(TAVOIDiskSetDiskStandbyTimer("/dev/sdb", 0xFB));
    for (const int seconds : {1, 5, 6, 1200, 1196, 0, -5, 1201, 2147483647}) {
        story_.Head(std::to_string(seconds) + " s");
        TELL(TAVODiskSetStandbySeconds(seconds));
    }
}

TEST_F(Drives, TimerByMinutesIsSaved)
{
    if (test::RootForm().empty())
        GTEST_SKIP() << "changes the system settings: only in an appliance root";
    test::WriteFile("/etc/tavoinfo.conf", "runsamba=\"yes\"\n");
    int minutes = 77;
    TELL(TAVODiskGetStandbyTimer(&minutes));
    EXPECT_EQ(minutes, 77);
    for (const int asked : {1, 20, 21, 30, 330, 480, 0, -1, 22, 25, 45, 360, 479, 481}) {
        story_.Head(std::to_string(asked) + " min");
        TELL(TAVODiskSetStandbyTimer(asked));
        TELL(TAVODiskGetStandbyTimer(&minutes));
        story_.Show("minutes", minutes);
    }
    TELL(TAVODiskSetStandbyTimer(0));  // what is saved already is not written again
    // A drive that refused: nothing is saved.
    Add("sdb", 16);
    fail_ = {"cmd e3 fb 00 00"};
    TELL(TAVODiskSetStandbyTimer(30));
    TELL(TAVODiskGetFileSBTimerSetting());
    EXPECT_EQ(test::ReadFile("/etc/tavoinfo.conf"), "runsamba=\"yes\"\nstandbytimer=0\n");
}

TEST_F(Drives, WriteCacheOfAtaDisks)
{
    TELL(TAVODiskWriteCacheGet("/dev/sda"));
    page_[85 * 2] = 1 << 5;
    TELL(TAVODiskWriteCacheGet("/dev/sda"));
    fail_ = {"cmd ec 01 00 01"};
    TELL(TAVODiskWriteCacheGet("/dev/sda"));
    fail_.insert("cmd a1 01 00 01");
    TELL(TAVODiskWriteCacheGet("/dev/sda"));
    TELL(TAVODiskWriteCacheSet("/dev/sda", 1));
    TELL(TAVODiskWriteCacheSet("/dev/sda", 0));
    fail_ = {"cmd ef 00 82 00"};
    TELL(TAVODiskWriteCacheSet("/dev/sda", 0));
    TELL(TAVODiskWriteCacheSet("/dev/sdq", 0));
}

TEST_F(Drives, WriteCacheOfDisksOnTheOtherInterface)
{
    Add("sdb", 16, true);
    mode_data_ = {23, 0, 0x10, 0, 0x88, 18, 0x04};
    mode_data_.resize(24);
    TELL(TAVODiskWriteCacheGet("/dev/sdb"));
    TELL(TAVODiskWriteCacheSet("/dev/sdb", 1));  // it is on already
    TELL(TAVODiskWriteCacheSet("/dev/sdb", 0));
    mode_data_[5] = 200;  // no page, no writing
    TELL(TAVODiskWriteCacheGet("/dev/sdb"));
    TELL(TAVODiskWriteCacheSet("/dev/sdb", 1));
}

TEST_F(Drives, SmartData)
{
    page_[2] = 194, page_[7] = 41;
    unsigned char page[512] = {};
    TELL(SmartDataRead("/dev/sda", page, 0));
    EXPECT_EQ(page[7], 41);
    TELL(TAVODiskTemperatureGet("/dev/sda"));
    TELL(TAVODiskTemperatureC("/dev/sda"));
    // The caller does not get a page with a wrong sum.
    std::memset(page, 0x5A, sizeof page);
    TELL(SmartDataRead("/dev/sda", page, 1));
    EXPECT_EQ(page[7], 0x5A);
    page_[511] = static_cast<unsigned char>(-194 - 41);
    TELL(SmartDataRead("/dev/sda", page, 1));
    EXPECT_EQ(page[7], 41);
    fail_ = {"cmd b0 00 d0 01"};
    TELL(SmartDataRead("/dev/sda", page, 0));
    TELL(TAVODiskTemperatureGet("/dev/sda"));
    TELL(TAVODiskTemperatureC("/dev/sda"));
}

TEST_F(Drives, SolidStateAndSticks)
{
    TELL(TAVODiskIsSSD("/dev/sda"));
    page_[83 * 2 + 1] = 0x40;
    TELL(TAVODiskIsSSD("/dev/sda"));
    fail_ = {"cmd ec 01 00 01"};
    TELL(TAVODiskIsSSD("/dev/sda"));

    std::string sector(512, 0);
    sector.replace(0, 3, "\xEB\x58\x90");
    sector.replace(82, 5, "FAT32");
    sector.replace(510, 2, "\x55\xAA");
    tree_.Put("/dev/sdk", sector);
    TELL(TAVOIsUSBDiskFATNoPartition("/dev/sdk"));
    tree_.Put("/dev/sdk", sector.substr(0, 511));
    TELL(TAVOIsUSBDiskFATNoPartition("/dev/sdk"));
    TELL(TAVOIsUSBDiskFATNoPartition(nullptr));
}

}  // namespace
