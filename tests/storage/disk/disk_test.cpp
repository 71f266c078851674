// Which disks there are, where they sit and what they are.
#include "tavo_appliance.h"
#include "tavo_disk.h"

#include "storage/storage_scene.h"
#include "support/test.h"

#include <climits>

#include <linux/fs.h>
#include <linux/hdreg.h>

namespace {

constexpr uint64_t kDiskBytes = uint64_t{6} * 1000 * 1000 * 1000 * 1000 + 100;

// Answers the size, and SMART data with one attribute.
test::RecordedCalls::Request Drive(uint64_t bytes = kDiskBytes, int attribute = 194)
{
    return [=](int, unsigned long request, void *argument) {
        unsigned char *const data = static_cast<unsigned char *>(argument);
        if (request == BLKGETSIZE64) {
            std::memcpy(argument, &bytes, sizeof bytes);
            return 0;
        }
        if (request == HDIO_DRIVE_CMD && data && data[0] == 0xB0 && data[2] == 0xD0) {
            data[4 + 2] = static_cast<unsigned char>(attribute);
            data[4 + 2 + 5] = 38;
            return 0;
        }
        errno = ENOTTY;
        return -1;
    };
}

class Disk : public test::StorageStory {
  protected:
    void AddDrive(const std::string &name, unsigned minor, const std::string &model)
    {
        tree_.AddDisk("/dev/" + name, 8, minor);
        tree_.Put("/sys/block/" + name + "/device/model", model + "\n");
    }
};

TEST_F(Disk, PathParse)
{
    for (const char *text : {"sda",         "/dev/sda",   "/dev/sda3\n",
                             "/dev/sdab12", "/dev/sdz\n", "sdba",
                             "sda1;reboot", "",           "sd",
                             "/dev/sd",     "/dev/hda",   "/dev//sda",
                             "//dev/sda",   "sda x",      "sdabc",
                             "sd1",         "sdA",        "sda99999999999",
                             "hda",         "sda-1",      static_cast<const char *>(nullptr)}) {
        DISKPATH path = {7, 7, 7, 7};
        TELL(DiskPathParse(text, &path));
        std::ostringstream fields;
        fields << path.iDisk << " " << path.nNameKind << " " << path.iUnit << " " << path.nPartition;
        story_.Show(text ? text : "NULL", fields.str());
    }
}

TEST_F(Disk, InfoOfTheWholeDisk)
{
    AddDrive("sda", 0, "NASLAB-HD-0     ");
    calls_.OnIoctl(Drive());
    DISKINFO *info = nullptr;
    TELL(DiskInfoGet("/dev/sda3", &info));
    std::ostringstream text;
    text << info->iDisk << " " << info->nNameKind << " " << info->iUnit << " " << info->nPartition << " "
         << info->szPath << " [" << info->szModel << "] " << info->cbDisk << " " << info->nTemperature;
    story_.Show("disk", text.str());
    DiskInfoFree(info);
    DiskInfoFree(nullptr);
}

TEST_F(Disk, EmptyBaysAndFailures)
{
    tree_.AddAbsent("/dev/sdb");
    AddDrive("sdc", 32, "x");
    DISKINFO *info = nullptr;
    for (const char *path : {"/dev/sdb", "/dev/sdq", "/dev/sdc", "rubbish"}) {
        story_.Head(path);
        TELL(DiskInfoGet(path, &info));
    }
    EXPECT_EQ(info, nullptr);
    uint64_t sectors = 5;
    TELL(DiskSizeGet("/dev/sdb", &sectors));
    TELL(DiskSizeGet("/dev/sdq", &sectors));
    EXPECT_EQ(sectors, 5u);
    calls_.OnIoctl(Drive(1535));
    TELL(DiskSizeGet("/dev/sdc", &sectors));
    story_.Show("sectors", sectors);
    TELL(DiskIsExist("/dev/sdc"));
    TELL(DiskIsExist("/dev/sdb"));
}

TEST_F(Disk, EnumHasTheBaysInOrderThenTheUnits)
{
    Model("maxdisks=\"4\"\nsupportebox=\"yes\"\n");
    AddDrive("sdc", 32, "third");
    AddDrive("sda", 0, "first");
    tree_.AddAbsent("/dev/sdb");
    tree_.Put("/sys/class/ata_device/dev4.0/class", "pmp\n");
    tree_.Put("/sys/class/ata_link/link4/sata_spd", "3.0 Gbps\n");
    AddDrive("sdd", 48, "hidden by the unit");
    AddDrive("sdaa", 64, "unit, first");
    AddDrive("sdac", 80, "unit, third");
    AddDrive("sde", 96, "beyond the bays");
    calls_.OnIoctl(Drive());
    const auto enumerate = [&](const int *filter) {
        std::vector<std::string> found;
        DISKLIST *list = nullptr;
        TELL(DiskInfoEnum(filter, &list));
        for (const DISKLIST *node = list; node; node = node->pNext)
            found.push_back(std::string(node->pInfo->szPath) + " " + node->pInfo->szModel);
        DiskInfoEnumFree(list);
        story_.Show("disks", found);
    };
    // Neither a missing node nor an empty bay is worth a line.
    enumerate(nullptr);
    for (const int filter : {int{DISK_ENUM_INTERNAL}, int{DISK_ENUM_UNITS}, 0})
        enumerate(&filter);
    tree_.Put("/sys/class/ata_link/link4/sata_spd", "<unknown>\n");  // switched off
    const int units = DISK_ENUM_UNITS;
    enumerate(&units);
    tree_.Remove("/sys/class");
    enumerate(nullptr);
    calls_.OnIoctl([](int, unsigned long, void *) {
        errno = EIO;
        return -1;
    });
    enumerate(nullptr);  // none of them answers
}

TEST_F(Disk, BaysAndLimitsOfTheModel)
{
    for (const char *settings : {"", "maxdisks=\"6\"\nraidsizelimit=\"2147483648\"\n", "maxdisks=26\nraidsizelimit=\n",
                                 "maxdisks=0\nraidsizelimit=-1\n", "maxdisks=6x\n", "maxdisks=4294967297\n"}) {
        Model(settings);
        story_.Head(settings);
        TELL(TAVOMaxDiskGet());
        TELL(RAIDSizeLimitGet());
        TELL(TAVOEBoxDevIs(0));
    }
    Model("raidsizelimit=18446744073709551616\n");
    EXPECT_EQ(RAIDSizeLimitGet(), ULONG_MAX);
    Model("raidsizelimit=4294967296\n");
    EXPECT_EQ(RAIDSizeLimitGet(), sizeof(long) == 4 ? ULONG_MAX : uint64_t{1} << 32);
}

TEST_F(Disk, KernelNumbersIdeFirstWholeDisksOnly)
{
    calls_.OnIoctl(Drive(uint64_t{98304} << 10));
    tree_.Put("/proc/partitions", std::string(test::Capture("proc_partitions-linux-6.1-armmp-lpae")) +
                                      "   3       64      100 hdb\n   3       65      100 hdb1\n  65       16  1 sdr\n"
                                      " 259        0      100 sdzz\n   8      256      100 sdzy\n");
    int32_t *numbers = nullptr;
    ASSERT_EQ(TAVODiskEnum(1, &numbers), 8);
    EXPECT_THAT(std::vector<int32_t>(numbers, numbers + 8),
                testing::ElementsAre(832, 2048, 2064, 2080, 2096, 2112, 2128, 16656));
    std::free(numbers);

    tree_.AddDisk("/dev/sdb", 8, 16);
    TAVODISKINFO *info = nullptr;
    TELL(TAVODiskGetInfo(1, 2064, &info));
    std::ostringstream text;
    text << info->nDevice << " " << info->szName << " " << info->nKind << " " << info->cMibDisk << " " << info->nStatus;
    story_.Show("disk", text.str());
    std::free(std::exchange(info, nullptr));
    TELL(TAVODiskGetInfo(2, 2064, &info));
    TELL(TAVODiskGetInfo(1, 2065, &info));  // a partition
    TELL(TAVODiskGetInfo(1, 9999, &info));
    TELL(TAVODiskGetInfo(1, 2080, &info));  // no node
    EXPECT_EQ(info, nullptr);
    tree_.Put("/proc/partitions", "major minor  #blocks  name\n\n");
    TELL(TAVODiskEnum(1, &numbers));
    EXPECT_EQ(numbers, nullptr);
    tree_.Remove("/proc/partitions");
    TELL(TAVODiskEnum(1, &numbers));
}

TEST_F(Disk, ContainerGet)
{
    Model("esatadiskname=\"sdy\"\n");
    for (const char *path : {"/dev/sda", "sdj", "sdj3\n", "sdk", "/dev/sdk1", "sdab", "/dev/sdab5", "sdy", "/dev/sdy",
                             "sdy1", "sd", "", "hda", "sd1", "sda-", "/dev/md0"}) {
        int kind = 0;
        story_.Head(path);
        TELL(DiskContainerGet(path, &kind));
        story_.Show("kind", kind);
    }
}

TEST_F(Disk, PartitionNumGet)
{
    const std::pair<const char *, int> rows[] = {{"sda3", 16},   {"sda10", 16}, {"sda", 16}, {"sda03", 16},
                                                 {"sda100", 16}, {"sdab5", 4},  {"3", 16},   {"", 16},
                                                 {"sda", 3},     {"sda3", 1},   {"sda3", 4}, {"sda99999999999", 16}};
    for (const auto &[path, size] : rows) {
        char base[16] = "?";
        story_.Head(std::string(path) + " into " + std::to_string(size));
        TELL(TAVODiskPartitionNumGet(path, base, size));
        story_.Show("disk", base);
    }
}

TEST_F(Disk, ModelOfADrive)
{
    AddDrive("sda", 0, "NASLAB-HD-0     ");
    tree_.AddDisk("/dev/sdb", 8, 16);
    char model[128] = "";
    for (const int size : {128, 7, 1}) {
        TELL(TAVOLnxDiskGetModel("/dev/sda", model, size));
        story_.Show("model", model);
    }
    TELL(TAVOLnxDiskGetModel("/dev/sdb", model, sizeof model));
    tree_.Put("/sys/block/sdb/device/model", "");
    TELL(TAVOLnxDiskGetModel("/dev/sdb", model, sizeof model));
    TELL(TAVOLnxDiskGetModel("/dev/sdz", model, sizeof model));
}

TEST_F(Disk, IsMvSocDriverFollowsTheLink)
{
    const char *const pci = "../../devices/pci0000:00/0000:00:01.0/host0/target0:0:0/0:0:0:0";
    const struct {
        const char *link;
        const char *id;  // of the controller; NULL for no such file
    } rows[] = {{"../../../0:0:0:0", nullptr},
                {"../../devices/platform/host3/target3:0:0/3:0:0:0", nullptr},
                {pci, "0x7042\n"},
                {pci, "0x6145\n"},
                {pci, "0x7042"},
                {pci, "0x8086\n"},
                {pci, nullptr},
                {nullptr, nullptr}};
    tree_.Put("/sys/block/sda/size", "1\n");
    for (const auto &row : rows) {
        tree_.Remove("/sys/block/sda/device");
        tree_.Remove("/sys/devices");
        if (row.link)
            tree_.Link("/sys/block/sda/device", row.link);
        if (row.id)
            tree_.Put("/sys/devices/pci0000:00/0000:00:01.0/device", row.id);
        story_.Head(std::string(row.link ? row.link : "no link") + ", " + (row.id ? row.id : "no id"));
        TELL(TAVODiskIsMvSocDriver("/dev/sda"));
    }
}

TEST_F(Disk, DDStatusGet)
{
    ::unlink("/tmp/tavodd.sdq");
    for (const char *line : {static_cast<const char *>(nullptr), "3145728/10485760\n", "0/6000000000000\n", "3145728\n",
                             "a/b\n", "-1/5\n", "1/99999999999999999999\n", ""}) {
        uint64_t done = 7;
        uint64_t total = 7;
        story_.Head(line ? line : "no job");
        if (line)
            test::WriteFile("/tmp/tavodd.sdq", line);
        TELL(DiskDDStatusGet("/dev/sdq", &done, &total));
        story_.Show("done", done);
        story_.Show("of", total);
    }
    ::unlink("/tmp/tavodd.sdq");
}

TEST_F(Disk, NameOfADescriptorIsTheKernels)
{
    tree_.AddDisk("/dev/sda", 8, 3);
    tree_.AddDisk("/dev/sdb", 104, 0);
    tree_.Link("/sys/dev/block/8:3", "../../devices/pci0000:00/ata1/host0/block/sda/sda3");
    tree_.Link("/sys/dev/block/104:0", "../../devices/pci0000:00/block/cciss!c0d0");
    for (const char *path : {"/dev/sda", "/dev/sdb", "/dev/null", "/none"}) {
        const int fd = ::open(path, O_RDONLY | O_CLOEXEC);
        char *name = nullptr;
        story_.Head(path);
        TELL((name = TAVODiskGetDevnameFromFd(fd)) != nullptr);
        story_.Show("name", name);
        std::free(name);
        ::close(fd);
    }
}

class Layout : public test::StorageStory {
  protected:
    Layout() { std::memset(layout_.get(), 0x5A, sizeof *layout_); }

    const std::unique_ptr<TavoPartitionLayout> layout_ = std::make_unique<TavoPartitionLayout>();
};

TEST_F(Layout, TakesTheRowsOfItsDiskAlone)
{
    tree_.Put("/proc/partitions",
              "major minor  #blocks  name\n\n   8  0  98304 sda\n   8  3  76800 sda3\n 259 7 5 sda512\n"
              "   8  9  1 sda513\n   8 9 1 sda-1\n   8 9 1 sda4294967297\n   8 9 1 sda18446744073709551617\n"
              "   8 9 1 sda1x\n   -8 9 1 sda1\n   8 9 1 sda0\n   8 9 1 sda03\n  65 9 1 sdaa\n  65 9 1 sdab1\n"
              "   8 9 1 xsda2\n   8 9 1 sda1" +
                  std::string(5000, 'z') + "\n");
    const auto get = [&] {
        TELL(DiskPartitionsLayoutGet("sda", layout_.get()));
        story_.Show("kind", layout_->nKind);
        story_.Show("disk", layout_->szDisk);
        story_.Show("entries", layout_->nEntry);
        for (const TavoPartitionEntry &entry : layout_->rgEntry) {
            std::ostringstream text;
            text << entry.iEntry << " " << entry.nKind << " " << entry.nMajor << ":" << entry.nMinor << " "
                 << entry.cBlock << " [" << entry.szDisk << "] [" << entry.szName << "] [" << entry.szPath << "]";
            if (entry.nKind != DISK_ENTRY_UNUSED || entry.iEntry == 511)
                story_.Show("entry", text.str());
        }
    };
    get();
    tree_.Put("/proc/partitions", "   8  0  98304 sdb\n");
    get();
    tree_.Remove("/proc/partitions");
    TELL(DiskPartitionsLayoutGet("sda", layout_.get()));
    TELL(DiskPartitionsLayoutGet("s", layout_.get()));
}

TEST_F(Layout, KnowsSystemDisksAndSpecialDevices)
{
    const auto get = [&] {
        TELL(DiskPartitionsLayoutGet("sdb", layout_.get()));
        story_.Show("kind", layout_->nKind);
        story_.Show("second entry", layout_->rgEntry[2].nKind);
        story_.Show("third entry", layout_->rgEntry[3].nKind);
    };
    tree_.Put("/proc/partitions", "   8  16  98304 sdb\n   8  17  1 sdb1\n");
    Model("supportraid=\"yes\"\n");
    commands_.Print(
        {{"/sbin/sfdisk -l -uS -N1 /dev/sdb", "/dev/sdb1 256 4980735 4980480 fd Linux raid autodetect\n"},
         {"/sbin/sfdisk -l -uS -N2 /dev/sdb", "/dev/sdb2 4980736 9175039 4194304 fd Linux raid autodetect\n"}});
    get();
    commands_.Exit(1);
    const std::string usb = "/sys/devices/pci0000:00/usb1/1-1/";
    tree_.Put(usb + "1-1:1.0/host6/target6:0:0/6:0:0:0/model", "x\n");
    tree_.Put(usb + "idVendor", "05ac\n");
    tree_.Put(usb + "idProduct", "1209\n");
    tree_.Link("/sys/block/sdb/device", "../../devices/pci0000:00/usb1/1-1/1-1:1.0/host6/target6:0:0/6:0:0:0");
    get();
}

}  // namespace
