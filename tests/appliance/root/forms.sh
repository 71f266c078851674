#!/usr/bin/env bash
# Each form says what it is and what it lacks, and what it does not lack is there.
. "$(dirname "$0")/common.sh"

for form in $forms; do
    same "$form: its name" "$form" "$(inside 'echo $TAVO_ROOT_FORM')"
    lacks=,$(inside 'echo $TAVO_ROOT_LACKS'),
    probe() { # NAME SCRIPT: works exactly when the form does not lack it
        local works=no wanted=yes
        inside "$2" >/dev/null 2>&1 && works=yes
        [[ $lacks != *,$1,* ]] || wanted=no
        same "$form: $1" "$wanted" "$works"
    }
    probe mount 'mount -t tmpfs none /mnt && mount | grep -q "on /mnt "'
    probe proc '[ "$(cat /proc/self/comm)" = cat ]'
    probe sys '[ -d /sys/class/net/lo ]'
    probe uts 'hostname other && [ "$(hostname)" = other ]'
    probe net '[ "$(busybox ip -o link | wc -l)" = 1 ] && busybox ip addr add 192.0.2.1/24 dev lo'
    probe setns 'busybox nsenter -m -t 1 true'
    probe mknod 'mknod /tmp/x b 8 0'
    probe uids 'touch /tmp/x && chown 1024:100 /tmp/x && [ "$(stat -c %u:%g /tmp/x)" = 1024:100 ]'
    probe pts '[ -c /dev/ptmx ]'
    # An emulator of single programs has threads, and so cannot enter mounts; any program may stand for one here.
    [[ ,$($enter --form "$form" --emulator "$root/bin/enter" -- /bin/sh -c 'echo $TAVO_ROOT_LACKS'), == *,setns,* ]] ||
        complain "$form: an emulator that is said to enter namespaces"
    inside 'echo x >/dev/null && [ "$(head -c 4 /dev/zero | wc -c)" = 4 ] && head -c 4 /dev/urandom >/dev/null' ||
        complain "$form: device nodes"
    inside '[ "$(id -u)" = 0 ] && [ "$(stat -c %a /tmp)" = 1777 ] && [ "$(stat -c %a /etc/shadow)" = 600 ] && [ "$(umask)" = 0022 ]' ||
        complain "$form: user, modes"
    same "$form: a folder is found where it is" "$(cat "$0" | wc -l)" \
        "$($enter --form "$form" --bind "$(dirname "$0")" -- wc -l <"$0" | tr -d ' ')"
    (cd "$(dirname "$0")" && same "$form: so is the current one" "$PWD" \
        "$($enter --form "$form" --bind "$PWD" -- pwd)"; exit $failed) || failed=1
done

# The same for an unprivileged user, if that user can reach the tree.
if [[ $(id -u) -eq 0 ]]; then
    as_nobody="setpriv --reuid nobody --regid nogroup --clear-groups"
    $as_nobody test -r "$root/manifest" || skip "nobody cannot read $root"
    found=$(cd / && $as_nobody "$root/bin/enter" --root "$root" --form namespaces -- /bin/sh -c '
        id -u; echo root:x:0:0::/: >/etc/passwd; cat /etc/passwd; ls /root /usr/tavo/etc/private
        echo x >/usr/tavo/etc/private/smbpasswd; mount -t tmpfs none /mnt && echo mounted; echo $TAVO_ROOT_LACKS; exit 7')
    status=$?
    same 'unprivileged: what it did' $'0\nroot:x:0:0::/:\n/root:\n\n/usr/tavo/etc/private:\nsmbpasswd\nmounted\nmknod,uids' "$found"
    same 'unprivileged: exit status' 7 "$status"
    (cd / && $as_nobody "$root/bin/enter" --root "$root" --form chroot -- true 2>/dev/null)
    same 'unprivileged: chroot is refused' 125 $?
fi
