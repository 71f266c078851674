#!/usr/bin/env bash
# A command's end comes out exactly as it was, and nothing of it lives on.
. "$(dirname "$0")/common.sh"

outcome() { # the status as a parent sees it: a number, or minus the signal's
    python3 -c 'import subprocess, sys
print(subprocess.run(sys.argv[1:], stdin=subprocess.DEVNULL, stderr=subprocess.DEVNULL).returncode)' "$@"
}
ends='exit 0|exit 3|exit 124|exit 125|exit 255|kill -TERM $$|kill -KILL $$|kill -SEGV $$|kill -ABRT $$'

for form in $forms; do
    same "$form: how commands end" '0 3 124 125 255 -15 -9 -11 -6' "$(python3 -c 'import subprocess, sys
print(*[subprocess.run(sys.argv[2:] + [end], stderr=subprocess.DEVNULL).returncode for end in sys.argv[1].split("|")])
' "$ends" $enter --form "$form" -- /bin/sh -c)"
    same "$form: no such command" 127 "$(outcome $enter --form "$form" -- /no/such/program)"
    same "$form: not executable" 126 "$(outcome $enter --form "$form" -- /etc/passwd)"
    same "$form: arguments" $'a b\n\n$x' "$($enter --form "$form" -- printf '%s\n' 'a b' '' '$x')"
    same "$form: standard input" through "$(echo through | $enter --form "$form" -- cat)"
    same "$form: no descriptor of the caller" '' "$(inside 'ls /proc/self/fd 2>/dev/null' 7</etc/passwd | grep -x 7)"

    # Daemons that left the session, ignore signals or still hold the output: all gone when enter comes back.
    inside "ln -s /bin/busybox /tmp/sleep
        (trap '' TERM HUP; setsid /tmp/sleep 1$$ </dev/null >/dev/null 2>&1 &)
        setsid /tmp/sleep 1$$ & exit 0"
    same "$form: left processes" '' "$(pgrep -f "^/tmp/sleep 1$$\$")"

    # A signal to enter goes to the command, which may take its time and choose its status.
    rm -f "$scratch/pid"
    $enter --form "$form" -- /bin/sh -c 'trap "exit 42" TERM; echo ready; while :; do sleep 0.05; done' >"$scratch/pid" &
    while [[ ! -s $scratch/pid ]]; do sleep 0.02; done
    kill -TERM $!
    wait $!
    same "$form: a forwarded signal" 42 $?
done

# Killed itself, it takes everything with it.
$enter -- /bin/sh -c 'ln -s /bin/busybox /tmp/sleep; echo; /tmp/sleep 2'$$ 2>/dev/null >"$scratch/started" &
while [[ ! -s $scratch/started ]]; do sleep 0.02; done
kill -KILL $!
wait $! 2>/dev/null
sleep 0.3
same 'after a kill' '' "$(pgrep -f "^/tmp/sleep 2$$\$")"

same 'no root there' 125 "$(outcome "$root/bin/enter" --root "$scratch" -- true)"
same 'a folder that is not there' 125 "$(outcome $enter --bind /no/such/folder -- true)"
same 'an unknown option' 125 "$(outcome $enter --no-such-option)"
[[ $(id -u) -ne 0 ]] || same 'a folder where none can be' 125 "$(outcome $enter --form chroot --bind /etc:/bin/sh/x -- true)"
same 'nothing is left of what failed' '' "$(ls "$root/runs")"
