#!/bin/sh
# The demonstration's first part: the machine itself. Runs inside the virtual appliance.
set -eu

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }
run() {
    printf '$ %s\n' "$*"
    "$@"
}
# Waits until the kernel is done with rebuilding.
settled() { while grep -qE 'recovery|resync' /proc/mdstat; do sleep 0.1; done; }

say 'A 32-bit ARM machine with six disks in their bays and two cards on one cable'
run uname -srm
run cat /proc/partitions
run ip -brief link

say 'Our sfdisk lays out two disks; an array on them loses one and gets a new one'
for disk in sda sdb; do
    sfdisk -M1 -q "/dev/$disk"
    run sfdisk -N1 -uS -j2048 -z131072 -tfd -F -q "/dev/$disk"
done
run sfdisk -l -uS /dev/sda
run mdadm --quiet --create /dev/md2 --run -e 1.2 -l 1 -n 2 /dev/sda1 /dev/sdb1
settled
run cat /proc/mdstat
run appliance-event pull 2
echo x >/dev/md2
sync
run cat /proc/mdstat
mdadm --quiet --stop /dev/md2
run appliance-event plug 2 --blank

say 'A cable is cut and restored'
ip link set eth0 up
run appliance-event cut eth0
run cat /sys/class/net/eth0/carrier
run appliance-event restore eth0
run cat /sys/class/net/eth0/carrier

if command -v tavoctl >/dev/null; then
    say 'What the library says of this machine'
    run tavoctl version --json
fi
