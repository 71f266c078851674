#!/usr/bin/env bash
# What a run writes reaches neither the tree, nor this machine, nor the next run.
. "$(dirname "$0")/common.sh"

fingerprint() { find "$root/tree" "$root/manifest" -printf '%p %s %T@ %m %l\n' | sort | sha256sum; }
before=$(fingerprint)
"$tools/tripwire" save "$scratch/machine"
write='set -e
echo intruder:x:0:0::/:/bin/sh >>/etc/passwd
rm /etc/shadow /etc.defaults/tavoinfo.conf
mkdir /tmp/lock /volume1
echo x >/usr/tavo/etc/private/smbpasswd
echo x >/dev/shm/left
ln -s /etc /var/services/homes
hostname intruder 2>/dev/null || true'

for form in $forms; do
    marker=/tmp/appliance-privacy-$$
    inside "$write; echo x >$marker" || complain "$form: writing inside failed"
    [[ ! -e $marker ]] || complain "$form: /tmp is this machine's"
    found=$(inside 'grep -c intruder /etc/passwd; ls -d /tmp/lock /volume1 /etc/shadow 2>/dev/null; cat /dev/shm/left 2>/dev/null
        stat -c "%a %u" /usr/tavo/etc/private/smbpasswd; hostname')
    wanted=$'0\n/etc/shadow\n600 0\n'
    [[ $form == chroot ]] && wanted+=$(uname -n) || wanted+=tavo
    same "$form: the next run" "$wanted" "$found"
done
same 'the tree' "$before" "$(fingerprint)"
same 'nothing is left of the runs' '' "$(ls "$root/runs")"
"$tools/tripwire" check "$scratch/machine" || complain 'this machine changed'

# The shared part is read-only where mounts are private; a bound folder too, unless asked otherwise.
mkdir "$scratch/ro" "$scratch/rw"
$enter --bind "$scratch/ro" --bind-rw "$scratch/rw:/mnt/rw" -- /bin/sh -c "
    touch /usr/sbin/x 2>/dev/null && echo usr; touch $scratch/ro/x 2>/dev/null && echo ro; echo kept >/mnt/rw/x" >"$scratch/out"
same 'what could be written' '' "$(cat "$scratch/out")"
same 'a writable folder' kept "$(cat "$scratch/rw/x")"

# No power over the machine: no device can be made, and the network is its own.
form=namespaces
inside 'mknod /tmp/disk b 8 0' 2>/dev/null && complain 'a device node can be made'
same 'network links' lo "$(inside 'ls /sys/class/net' | grep -v bonding_masters)"
[[ $(inside 'cat /proc/net/dev' | grep -c :) == 1 ]] || complain 'there are links beside lo'
inside 'kill -0 1 && [ ! -d /proc/'$$' -o "$(cat /proc/'$$'/comm 2>/dev/null)" != bash ]' || complain "this machine's processes are visible"
