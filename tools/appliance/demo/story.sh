#!/bin/sh
# The demonstration: runs inside an appliance root and says every command before it runs it.
set -eu
export PATH=/usr/sbin:/usr/bin:/sbin:/bin

say() { printf '\n\033[1m%s\033[0m\n' "$*"; }

# A command as a person would type it, then what it prints. Its failure is part of the story only where expected.
run() {
    printf '$ %s\n' "$*"
    "$@"
}
expect() {
    wanted=$1
    shift
    printf '$ %s\n' "$*"
    status=0
    "$@" || status=$?
    printf '(exit status %s)\n' "$status"
    [ "$status" = "$wanted" ]
}

say 'An appliance, its library and its command-line program'
run uname -m
run tavoctl version

say 'Settings: the system settings file, rewritten safely, comments and order kept'
run tavoctl conf list
run tavoctl conf set --dry-run runsamba yes
run tavoctl conf set runsamba yes
run tavoctl conf get runsamba
run tavoctl conf get --json runsamba
expect 3 tavoctl conf get no_such_key

say 'Sections: files divided by [headers]'
cat >/tmp/share.conf <<'EOF'
[homes]
path=/volume1/homes
[photo]
# for everybody
path=/volume1/photo
ro=guest
EOF
run tavoctl section list --file /tmp/share.conf
run tavoctl section get --file /tmp/share.conf photo
run tavoctl section set --file /tmp/share.conf photo path=/volume2/photo rw=@users
run cat /tmp/share.conf

say 'Locks: processes that change the same files wait for each other'
tavoctl lock run tavoinfo -- sleep 2 &
sleep 0.3
expect 4 tavoctl lock run --timeout 0 tavoinfo -- echo 'never runs'
run tavoctl lock run --timeout 5 tavoinfo -- echo 'runs when the first has let go'
wait

say 'Programs: a clean child, a time limit, an exact exit status'
expect 1 tavoctl proc run --timeout 1 /bin/sleep 10
run tavoctl proc find sh

say 'Errors say what, where and why'
expect 1 tavoctl conf set --file /no/such/directory/file key value
run tavoctl error explain 0x0900
