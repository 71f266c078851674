// The appliance's partitioning tool, run on image files.
#include "support/running_program.h"
#include "support/test.h"
#include "support/text_lines.h"

namespace {

constexpr off_t kGiB = off_t{1} << 30;

class Sfdisk : public testing::Test {
  protected:
    void SetUp() override
    {
        if (test::RootLacks("foreign-exec"))
            GTEST_SKIP() << "runs /sbin/sfdisk: only in an appliance root that runs it";
        Resize(8 * kGiB);
    }

    void Resize(off_t bytes)
    {
        const int fd = ::open(image_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
        ASSERT_EQ(::ftruncate(fd, bytes), 0);
        ::close(fd);
    }

    // Runs it on the image, with words that have no blanks in them.
    test::Ran Run(const std::string &line)
    {
        std::istringstream in(line);
        test::Words words{std::istream_iterator<std::string>(in), {}};
        words.push_back(image_);
        return test::RunningProgram("/sbin/sfdisk", words).Wait();
    }

    std::string Sector(off_t number = 0)
    {
        std::string sector(512, '?');
        const int fd = ::open(image_.c_str(), O_RDONLY | O_CLOEXEC);
        EXPECT_EQ(::pread(fd, sector.data(), sector.size(), number * 512), 512);
        ::close(fd);
        return sector;
    }

    void PutSector(off_t number, const std::string &sector)
    {
        const int fd = ::open(image_.c_str(), O_WRONLY | O_CLOEXEC);
        EXPECT_EQ(::pwrite(fd, sector.data(), sector.size(), number * 512), 512);
        ::close(fd);
    }

    // The list without the name of the image.
    std::string List(const std::string &line = "-l -uS")
    {
        std::string text = Run(line).out;
        for (size_t at; (at = text.find(image_)) != text.npos;)
            text.erase(at, image_.size());
        return text;
    }

    test::ScratchDir dir_;
    std::string image_ = dir_ / "disk";
};

// Makes an entry empty, as the library does it.
std::string Emptying(int number)
{
    return "-N" + std::to_string(number) + " -q -f --no-reread -o0 -z0 -t0 -F -D";
}

std::string Entry(std::initializer_list<unsigned char> bytes)
{
    return {bytes.begin(), bytes.end()};
}

// A table sector with these entries.
std::string Table(const std::vector<std::string> &entries)
{
    std::string sector(512, '\0');
    for (size_t i = 0; i < entries.size(); ++i)
        sector.replace(446 + 16 * i, entries[i].size(), entries[i]);
    return sector.replace(510, 2, "\x55\xAA");
}

std::string SmallEntry(unsigned char type, unsigned char start, unsigned char count)
{
    return Entry({0, 0, 0, 0, type, 0, 0, 0, start, 0, 0, 0, count, 0, 0, 0});
}

TEST_F(Sfdisk, MakesAndUnmakesTheLayoutOfASystemDisk)
{
    PutSector(0, std::string(512, 'x'));
    EXPECT_EQ(Run("-M1").status, 0);
    EXPECT_EQ(Sector(), Table({})) << "nothing of what stood there is left";
    EXPECT_EQ(Run("-N1 -uS -q -f -j256 -z4980480 -tfd -F").status, 0);
    EXPECT_EQ(Run("-N2 -uS -q -f -j0 -z4194304 -tfd -F").status, 0);
    EXPECT_EQ(Run("-N3 -uS -q -f -j262144 -z-1 -tfd -F").status, 0);
    EXPECT_EQ(List(), "1 256 4980735 4980480 fd Linux raid autodetect\n"
                      "2 4980736 9175039 4194304 fd Linux raid autodetect\n"
                      "3 9437184 16777215 7340032 fd Linux raid autodetect\n");
    EXPECT_EQ(List("-l -uS -N2"), "2 4980736 9175039 4194304 fd Linux raid autodetect\n");
    // Cylinder, head and sector as every other tool writes them: 0/4/5 for sector 256, 310/9/19 for 4980735.
    EXPECT_EQ(Sector().substr(446, 16), Entry({0, 4, 5, 0, 0xFD, 9, 0x53, 0x36, 0, 1, 0, 0, 0, 0xFF, 0x4B, 0}));

    EXPECT_EQ(Run(Emptying(3)).status, 0);
    EXPECT_EQ(Run(Emptying(3)).status, 0) << "empty already";
    EXPECT_EQ(Run(Emptying(5)).status, 1) << "no such thing";
    const test::Ran absent = Run("-l -uS -N3");
    EXPECT_EQ(std::to_string(absent.status) + absent.out + absent.err, "1");
    EXPECT_EQ(Sector().substr(478, 32), std::string(32, '\0'));
    struct stat facts;
    ASSERT_EQ(::stat(image_.c_str(), &facts), 0);
    EXPECT_LE(facts.st_blocks, 16) << "nothing but the first sector was written";
}

TEST_F(Sfdisk, ChangesNothingButTheEntry)
{
    std::string before = Table({SmallEntry(0x83, 8, 8), SmallEntry(0x82, 16, 8)});
    before.replace(0, 446, std::string(446, 'b'));
    before[446] = '\x80';
    PutSector(0, before);
    EXPECT_EQ(Run("-N2 -j4 -z2 -tee -q").status, 0);
    std::string after = Sector();
    EXPECT_EQ(after.substr(478 - 16 + 8, 8), Entry({20, 0, 0, 0, 2, 0, 0, 0}));
    after.replace(462, 16, before, 462, 16);
    EXPECT_EQ(after, before);
}

constexpr off_t kSectorsOf3Tb = 5860533168;

TEST_F(Sfdisk, RefusesWhatDoesNotFit)
{
    constexpr off_t guid = kSectorsOf3Tb * 512;  // so large a disk gets a GUID table
    const struct {
        off_t bytes;
        const char *line;
        const char *complaint;
    } rows[] = {
        {kGiB, "-N1 -j0 -z10 -t83", "cover the partition table"},
        {kGiB, "-N1 -j2097152 -z-1 -t83", "start beyond"},
        {kGiB, "-N1 -j1 -z2097152 -t83", "reach beyond"},
        {kGiB, "-N1 -j1 -z18446744073709551615 -t83", "reach beyond"},
        {kGiB, "-N1 -j18446744073709551615 -z1 -t83", "start beyond"},
        {kGiB, "-N4 -o107 -z10 -t83", "overlap partition 3"},
        {kGiB, "-N4 -o95 -z10 -t83", "overlap partition 3"},
        {kGiB, "-N4 -o90 -z100 -t83", "overlap partition 3"},
        {4096 * kGiB, "-N1 -o4294967296 -z1 -t83", "sector 2^32"},
        {4096 * kGiB, "-N1 -o4294967295 -z2 -t83", "sector 2^32"},
        {kGiB, "-N5 -j1 -z1 -t83", "only partitions 1 to 4"},
        {kGiB, "-N1 -j1 -z1 -tf", "extended partitions"},
        {guid, "-N1 -j33 -z10 -t83", "cover the partition table"},
        {guid, "-N1 -j5860533135 -z-1 -t83", "start beyond"},
        {guid, "-N1 -j5860533134 -z2 -t83", "reach beyond"},
        {guid, "-N1 -j200 -z18446744073709551615 -t83", "reach beyond"},
        {guid, "-N4 -o107 -z10 -t83", "overlap partition 3"},
        {guid, "-N5 -j1 -z1 -t83", "only partitions 1 to 4"},
        {guid, "-N1 -j200 -z1 -tf", "extended partitions"},
        {guid, "-N1 -j200 -z1 -t8e", "types fd, 82 and 83"},
    };
    for (const auto &row : rows) {
        Resize(row.bytes);
        PutSector(0, Table({"", "", SmallEntry(0x83, 100, 8)}));
        if (row.bytes == guid) {
            ASSERT_EQ(Run("-M1").status, 0);
            ASSERT_EQ(Run("-N3 -o100 -z8 -t83").status, 0);
        }
        const std::string before = Sector(0) + Sector(1) + Sector(2);
        const test::Ran result = Run(row.line);
        EXPECT_EQ(result.status, 1) << row.complaint;
        EXPECT_THAT(result.err, testing::HasSubstr(row.complaint));
        EXPECT_EQ(Sector(0) + Sector(1) + Sector(2), before) << row.line;
        EXPECT_EQ(Run("-N4 -o108 -z10 -t83").status, 0) << "right after it";
    }

    Resize(0);
    Resize(kGiB);
    PutSector(0, Table({SmallEntry(0xEE, 1, 255)}));
    EXPECT_THAT(Run("-N2 -j1 -z1 -t83").err, testing::HasSubstr("GUID"));
    PutSector(0, std::string(512, '\0'));
    EXPECT_THAT(Run("-N1 -j1 -z1 -t83").err, testing::HasSubstr("no partition table"));
    EXPECT_EQ(Run("-l").status, 1);
    EXPECT_EQ(Run("-l -N1").err, "") << "that a blank disk lacks a partition is an answer";
}

// Whatever other people use finds nothing to complain about.
void ExpectSound(const std::string &image)
{
    const std::vector<std::string> checks[] = {
        {"/usr/lib/peers/sfdisk", "--verify", image},
        {"/usr/lib/peers/sgdisk", "--verify", image},
        {"/usr/lib/peers/parted", "--script", image, "unit", "s", "print"},
    };
    for (const std::vector<std::string> &check : checks) {
        if (::access(check[0].c_str(), X_OK) != 0)
            continue;  // the virtual appliance has none of them
        const test::Ran ran = test::RunningProgram(check[0], {check.begin() + 1, check.end()}).Wait();
        EXPECT_EQ(ran.status, 0) << check[0] << ran.out << ran.err;
        if (check[0].ends_with("sgdisk")) {
            EXPECT_THAT(ran.out, testing::HasSubstr("No problems found")) << ran.out;
        }
    }
}

TEST_F(Sfdisk, WritesAGuidTableToLargeDisks)
{
    const struct {
        off_t sectors, start, gap;
    } rows[] = {{(off_t{1} << 32) + 1, 256, 262144},
                {kSectorsOf3Tb, 256, 262144},
                {kSectorsOf3Tb, 63, 262144},
                {off_t{8} << 31, 256, 262144},
                {off_t{40} << 31, 256, 16002}};
    for (const auto &row : rows) {
        if (::truncate(image_.c_str(), 0) != 0 || ::truncate(image_.c_str(), row.sectors * 512) != 0)
            continue;  // the file system, or a 32-bit kernel, ends before
        PutSector(0, std::string(512, 'x'));
        EXPECT_EQ(Run("-M1").status, 0);
        EXPECT_EQ(Run("-l").out, "");
        EXPECT_EQ(Run("-N1 -uS -q -f -z4980480 -tfd -F -j" + std::to_string(row.start)).status, 0);
        EXPECT_EQ(Run("-N2 -uS -q -f -j0 -z4194304 -t82 -F").status, 0);
        const test::Ran rest = Run("-N3 -uS -q -f -z-1 -t83 -F -j" + std::to_string(row.gap));
        EXPECT_EQ(std::to_string(rest.status) + rest.out + rest.err, "0");
        const off_t second = row.start + 4980480;
        const off_t third = second + 4194304 + row.gap;
        const off_t last = row.sectors - 34;  // up to the copy of the table
        std::ostringstream list;
        list << "1 " << row.start << " " << second - 1 << " 4980480 fd Linux raid autodetect\n2 " << second << " "
             << second + 4194303 << " 4194304 82 Linux swap\n3 " << third << " " << last << " " << last - third + 1
             << " 83 Linux\n";
        EXPECT_EQ(List(), list.str());
        EXPECT_EQ(Sector().substr(446 + 4, 1), "\xEE") << "the protective table";
        ExpectSound(image_);
        EXPECT_EQ(Run(Emptying(3)).status, 0);
        EXPECT_EQ(Run(Emptying(3)).status, 0) << "empty";
        EXPECT_EQ(Run(Emptying(15)).status, 1);
        EXPECT_EQ(List("-l -N3"), "");
        ExpectSound(image_);
    }
}

TEST_F(Sfdisk, RepairsADamagedCopyOfAGuidTable)
{
    Resize(kSectorsOf3Tb * 512);
    ASSERT_EQ(Run("-M1").status, 0);
    ASSERT_EQ(Run("-N3 -o100 -z8 -t83").status, 0);
    EXPECT_EQ(Run("-N4 -o108 -z10 -tfd").status, 0);
    EXPECT_EQ(Run("-N3 -o34 -z8 -tfd").status, 0) << "in its own place";
    EXPECT_EQ(List(), "3 34 41 8 fd Linux raid autodetect\n4 108 117 10 fd Linux raid autodetect\n");

    // The first copy is damaged: the second one is read, and both are whole after the next change.
    PutSector(1, std::string(512, 'r'));
    EXPECT_EQ(List("-l -N4"), "4 108 117 10 fd Linux raid autodetect\n");
    EXPECT_EQ(Run("-N3 -q -f -o0 -z0 -t0 -F -D").status, 0);
    ExpectSound(image_);
    // Both: nothing is changed, and an empty table makes the disk usable.
    PutSector(1, std::string(512, 'r'));
    PutSector(kSectorsOf3Tb - 1, std::string(512, 'r'));
    EXPECT_THAT(Run("-N1 -j200 -z1 -t83").err, testing::HasSubstr("damaged GUID"));
    EXPECT_EQ(List("-l -N4"), "");
    EXPECT_EQ(Run("-M1").status, 0);
    ExpectSound(image_);
}

TEST_F(Sfdisk, ChangesTheKindOfTableForAnEmptyOneAlone)
{
    // A GUID table on a small disk, from the time when it was in another box.
    const std::string peer = "/usr/lib/peers/sgdisk";
    if (::access(peer.c_str(), X_OK) != 0)
        GTEST_SKIP() << "needs another tool that writes such tables";
    ASSERT_EQ(test::RunningProgram(peer, {"--clear", "--new=2:4096:8191", "--typecode=2:ef00", image_}).Wait().status,
              0);
    EXPECT_EQ(List(), "2 4096 8191 4096 ef Unknown\n");
    EXPECT_EQ(Run("-N1 -o2048 -z1024 -t83").status, 0);
    EXPECT_EQ(List("-l -N1"), "1 2048 3071 1024 83 Linux\n");
    ExpectSound(image_);
    ASSERT_EQ(Run("-M1").status, 0);
    EXPECT_EQ(Sector(0), Table({}));
    EXPECT_EQ(Sector(1), std::string(512, '\0')) << "or it would come back";
    EXPECT_EQ(Sector(8 * kGiB / 512 - 1), std::string(512, '\0'));
    const test::Ran other = test::RunningProgram("/usr/lib/peers/sfdisk", {"--dump", image_}).Wait();
    EXPECT_THAT(other.out, testing::HasSubstr("label: dos"));
}

TEST_F(Sfdisk, TheRestOfALargeDiskEndsWhereNumbersEnd)
{
    Resize(4096 * kGiB);
    PutSector(0, Table({}));  // its kind stays
    const test::Ran loud = Run("-N1 -j256 -z-1 -t83");
    EXPECT_EQ(loud.status, 0);
    EXPECT_THAT(loud.err, testing::HasSubstr("2^32"));
    EXPECT_EQ(List(), "1 256 4294967295 4294967040 83 Linux\n");
    EXPECT_EQ(Sector().substr(451, 3), "\xFE\xFF\xFF");
    EXPECT_EQ(Run("-N1 -j256 -z-1 -t83 -q").err, "");
    // Started by a daemon without standard descriptors, it opens the disk first: its remark must not become a part of it.
    const auto sectors = [&] {
        return Sector(0) + Sector(1) + Sector(2) + Sector(3);
    };
    const std::string expected = sectors();
    for (const std::string closed : {"2>&-", ">&- 2>&-", "<&- >&- 2>&-"}) {
        PutSector(0, Table({}));
        const std::string line = "exec /sbin/sfdisk -N1 -j256 -z-1 -t83 \"$0\" " + closed;
        EXPECT_EQ(test::RunningProgram("/bin/sh", {"-c", line, image_}).Wait().status, 0) << closed;
        EXPECT_EQ(sectors(), expected) << closed;
    }
}

TEST_F(Sfdisk, RefusesWhatItDoesNotKnow)
{
    const std::string before = Sector();
    for (const std::string &line : test::Lines(
             "-d\n-l -uM\n-A1\n-M2\n-M1 -N1\n-M1 -l\n-l -z1\n-N1\n-N0 -z1 -t83 -j1\n-N1x -z1 -t83 -j1\n-N1 -z1 -t83\n"
             "-N1 -z1 -j1\n-N1 -z1 -j1 -t0\n-N1 -z1 -j1 -t100\n-N1 -z1 -j1 -tgg\n-N1 -z-2 -j1 -t83\n-N1 -z1 -j-1 -t83\n"
             "-N1 -z1 -j1 -o1 -t83\n-N1 -z1 -j -t83\n-N1 -z18446744073709551616 -j1 -t83\n-N1 -z0 -t83\n--delete\n-lq\n"
             "-F\n\n-l /dev/null")) {
        const test::Ran result = Run(line);
        EXPECT_EQ(result.status, 2) << line;
        EXPECT_THAT(result.err, testing::StartsWith("sfdisk: "));
    }
    EXPECT_EQ(Sector(), before);
    EXPECT_EQ(Run("--help").status, 0);
    const std::string image = image_;
    for (const char *no_disk : {"/dev/null", "/tmp", "/nowhere"}) {
        image_ = no_disk;
        EXPECT_EQ(Run("-M1").status, 1) << no_disk;
    }
    image_ = dir_ / "fifo";
    ASSERT_EQ(::mkfifo(image_.c_str(), 0600), 0);
    EXPECT_EQ(Run("-M1").status, 1) << "and does not wait";
    image_ = image;
}

TEST_F(Sfdisk, ListsAndEmptiesLogicalPartitions)
{
    PutSector(0, Table({SmallEntry(0x83, 8, 8), SmallEntry(0x0F, 32, 96)}));
    PutSector(32, Table({SmallEntry(0x83, 2, 10), SmallEntry(0x05, 32, 32)}));
    PutSector(64, Table({SmallEntry(0x82, 3, 11), SmallEntry(0x05, 64, 32)}));
    PutSector(96, Table({SmallEntry(0x8E, 4, 12), SmallEntry(0x05, 0, 32)}));  // back to the first: a circle
    EXPECT_EQ(List(),
              "1 8 15 8 83 Linux\n2 32 127 96 f Win95 Ext'd (LBA)\n5 34 43 10 83 Linux\n6 67 77 11 82 Linux swap\n"
              "7 100 111 12 8e Linux LVM\n");
    EXPECT_EQ(Run(Emptying(6)).status, 0);
    EXPECT_EQ(List("-l -N6"), "6 100 111 12 8e Linux LVM\n") << "the last moves up, as the kernel counts";
    EXPECT_EQ(Sector(0), Table({SmallEntry(0x83, 8, 8), SmallEntry(0x0F, 32, 96)}));
    EXPECT_EQ(Run(Emptying(7)).status, 1);
    PutSector(32, std::string(512, 'r'));
    EXPECT_EQ(List(), "1 8 15 8 83 Linux\n2 32 127 96 f Win95 Ext'd (LBA)\n") << "a broken chain ends there";
}

}  // namespace
