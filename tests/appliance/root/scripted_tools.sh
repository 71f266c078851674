#!/usr/bin/env bash
# Scripted tools from a shell: each argument vector is written down exactly, and both a call too many and one too few
# are found.
. "$(dirname "$0")/common.sh"
form=namespaces

same 'hostile arguments' "- /sbin/mdadm $'a b' \$'' \$'line\\nbreak' \$'it\\'s' \$'back\\\\slash' \$'\\xc3\\xa9\\x01' plain,-x=/dev/md0" \
    "$(inside 'scenario begin; /sbin/mdadm "a b" "" "line
break" "it'"'"'s" "back\\slash" "$(printf "\303\251\001")" plain,-x=/dev/md0 2>/dev/null; cat /var/scenario/log')"

same 'as scripted' $'  /dev/md0|vg0\nstatus 5\nstatus 0' "$(inside '
    printf "  /dev/md0|vg0\n" >/tmp/out
    scenario expect --stdout /tmp/out --status 5 -- pvs --separator "|"
    scenario expect -- /sbin/pvremove -ff -y /dev/sda3
    scenario expect --times any -- sysctl ...
    pvs --separator "|"; echo status $?
    sysctl -w a=1; sysctl -w b=2
    /sbin/pvremove -ff -y /dev/sda3; echo status $?
    scenario check')"

same 'a call that did not come' 'not called: /sbin/mdadm -S /dev/md0' \
    "$(inside 'scenario expect -- /sbin/mdadm -S /dev/md0; scenario check && echo passed')"
same 'a call too many' $'97\nnot expected: /sbin/mdadm -S /dev/md0' \
    "$(inside 'scenario expect -- /sbin/mdadm -S /dev/md0; mdadm=/sbin/mdadm; $mdadm -S /dev/md0; $mdadm -S /dev/md0 2>/dev/null
        echo $?; scenario check && echo passed')"
same 'another order' $'not expected: lvremove b\nnot called: lvremove b' \
    "$(inside 'scenario expect -- vgremove a; scenario expect -- lvremove b; lvremove b 2>/dev/null; vgremove a
        scenario check')"
same 'any order, where allowed' '' \
    "$(inside 'scenario expect -- vgremove a; scenario expect -- lvremove b; echo any >/var/scenario/order; lvremove b; vgremove a
        scenario check')"
same 'an effect of the tool' 'lease for eth0, 137' "$(inside '
    printf "#!/bin/sh\necho lease for \$2 >/tmp/lease\n" >/tmp/effect; chmod 755 /tmp/effect
    scenario expect --run /tmp/effect --status "signal 9" -- /sbin/dhcpcd -n eth0
    /sbin/dhcpcd -n eth0; echo "$(cat /tmp/lease), $?"' 2>/dev/null)"
same 'without a scenario the real one runs' '~ /bin/ping -c 1 127.0.0.1' \
    "$(inside '/bin/ping -c 1 127.0.0.1 >/dev/null && cat /var/scenario/log')"

# 40 calls at once: each is counted.
same 'calls at the same time' 40 "$(inside '
    scenario expect --times 40 -- pvscan
    for i in 1 2 3 4 5 6 7 8 9 10; do (pvscan; pvscan; pvscan; pvscan) & done; wait
    scenario check; grep -c "^0001 pvscan$" /var/scenario/log')"
