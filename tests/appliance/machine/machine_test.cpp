// The virtual appliance is the machine that the families' own tests rely on: its processor, disks, kernel and tools.
#include "support/machine.h"

#include <gmock/gmock.h>

#include <sys/utsname.h>

namespace {

using test::Shell;
using test::Told;
using testing::HasSubstr;

using MachineFacts = test::MachineTest;
using MachineTools = test::MachineTest;
using MachineEvents = test::MachineTest;

TEST_F(MachineFacts, HasTheLibrarysProcessor)
{
    utsname name;
    ASSERT_EQ(::uname(&name), 0);
    EXPECT_STREQ(name.machine, "armv7l");
    EXPECT_EQ(sizeof(long), 4u);
    EXPECT_EQ(sizeof(void *), 4u);
    EXPECT_THAT(Told("tavoctl version --json"), HasSubstr("armv7l"));
}

TEST_F(MachineFacts, DisksAreInTheOrderOfTheirBays)
{
    for (int bay = 1; bay <= 6; ++bay) {
        const std::string disk = std::string("sd") + "abcdef"[bay - 1];
        EXPECT_THAT(Told("readlink /sys/block/" + disk), HasSubstr("/ata" + std::to_string(bay) + "/"));
        EXPECT_THAT(Told("hdparm -i /dev/" + disk), HasSubstr("NASLAB-HD-" + std::to_string(bay)));
        EXPECT_EQ(Told("blockdev --getsize64 /dev/" + disk), "100663296\n");
    }
}

// In a family's own tests a missing tool would be harder to understand.
TEST_F(MachineTools, EachDoesItsWork)
{
    static constexpr const char *lines[] = {
        "mkfs.ext4 -q -O ^has_journal /dev/sda && mount -o usrquota,grpquota /dev/sda /mnt && quotacheck -cugm /mnt && "
        "quotaon /mnt && setquota -u 1000 0 64 0 0 /mnt && chmod 777 /mnt && "
        "! setpriv --reuid 1000 --regid 1000 --clear-groups dd if=/dev/zero of=/mnt/full bs=4k count=32 && "
        "[ $(stat -c %s /mnt/full) = 65536 ] && quotaoff /mnt && umount /mnt",
        "mkfs.ext3 -q /dev/sdb && mount -t ext3 -o usrquota /dev/sdb /mnt && umount /mnt",
        "mdadm -q -C /dev/md5 -R -e 1.2 -l 5 -n 3 /dev/sdb /dev/sdc missing && grep -q 'active raid5' /proc/mdstat && "
        "pvcreate -q -ff -y /dev/md5 && vgcreate -q vg1 /dev/md5 && lvcreate -q -y -W n -l100%VG -n volume1 vg1 && "
        "[ -b /dev/vg1/volume1 ] && vgremove -q -f vg1 && pvremove -q /dev/md5 && mdadm -q -S /dev/md5",
        "ip link add bond0 type bond mode active-backup miimon 100 && ip link set eth0 master bond0 && "
        "ip link set bond0 up && grep -q 'Slave Interface: eth0' /proc/net/bonding/bond0 && ip link delete bond0",
        "ip netns add far && ip link add near type veth peer name there netns far && ip addr add 10.8.8.1/24 dev near "
        "&& "
        "ip -n far addr add 10.8.8.2/24 dev there && ip link set near up && ip -n far link set there up && "
        "ping -q -c1 -W9 10.8.8.2 && ip -6 addr add fd00::1/64 dev near && ip netns delete far",
        "ip link add some0 type dummy && ip link delete some0",
        "dnsmasq --test",
        "printf '[global]\\n' >/tmp/smb.conf && pdbedit -s /tmp/smb.conf -b tdbsam:/tmp/passdb.tdb -L",
        "killall --version && strace -V && smartctl -i /dev/sda && ethtool eth0",
    };
    for (const char *line : lines) {
        const test::CommandResult result = Shell(line);
        EXPECT_EQ(result.status, 0) << line << "\n" << result.output;
    }
}

TEST_F(MachineEvents, ADiskLeavesAnArrayAndANewOneComes)
{
    Told("mdadm -q -C /dev/md2 -R -e 1.2 -l 1 -n 2 --assume-clean /dev/sda /dev/sdb");
    test::Happen("pull 2");
    Told("echo x >/dev/md2 && sync");
    EXPECT_EQ(Told("cat /sys/block/md2/md/degraded"), "1\n");
    Told("mdadm -q /dev/md2 --remove detached");  // as long as an array holds it, its name is taken
    test::Happen("plug 2 --blank");
    EXPECT_NE(Shell("mdadm -E /dev/sdb").status, 0) << "not empty";
    Told("mdadm -q /dev/md2 --add /dev/sdb; mdadm -W /dev/md2; grep -F '[UU]' /proc/mdstat");
}

TEST_F(MachineEvents, ACableIsCutAndRestored)
{
    Told("ip link set eth0 up");
    test::Happen("cut eth0");
    EXPECT_EQ(Told("cat /sys/class/net/eth0/carrier"), "0\n");
    test::Happen("restore eth0");
    EXPECT_EQ(Told("cat /sys/class/net/eth0/carrier"), "1\n");
}

}  // namespace
