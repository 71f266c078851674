#!/bin/sh
# The demonstration's first part: the machine itself. Runs inside the virtual appliance.
set -eu

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }
run() {
    printf '$ %s\n' "$*"
    "$@"
}

say 'A 32-bit ARM machine with six disks in their bays and two cards on one cable'
run uname -srm
run cat /proc/partitions
run ip -brief link

say 'A disk is pulled, and a new one comes into its bay'
run appliance-event pull 2
run grep sd /proc/partitions
run appliance-event plug 2 --blank
run grep sd /proc/partitions

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
