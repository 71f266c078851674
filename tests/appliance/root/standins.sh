#!/usr/bin/env bash
# Start-up scripts start, stop and misbehave as scripted; ps lists the running processes.
. "$(dirname "$0")/common.sh"
form=namespaces
rc=/usr/tavo/etc/rc.d

same 'start and stop' $'0\nalive\n0\ngone\nS80samba.sh start\nS80samba.sh start = 0\nS80samba.sh stop\nS80samba.sh stop = 0' "$(inside "
    $rc/S80samba.sh start; echo \$?
    kill -0 \$(cat /var/run/smbd.pid) \$(cat /var/run/nmbd.pid) && echo alive; pids=\"\$(cat /var/run/smbd.pid)\"
    $rc/S80samba.sh stop; echo \$?
    kill -0 \$pids 2>/dev/null || [ -e /var/run/smbd.pid ] || echo gone
    cat /var/standin/rc.log")"
same 'signals are written down' 'signal 1' "$(inside "
    $rc/S97apache-user.sh start; kill -HUP \$(cat /var/run/httpd-user.pid); sleep 0.2; tail -1 /var/standin/httpd-user.log")"
same 'every script of the table starts and stops' '' "$(inside "
    for script in $rc/*; do \$script start || echo \$script start; done
    for script in $rc/*; do \$script restart || echo \$script restart; done
    for script in $rc/*; do \$script stop || echo \$script stop; done
    ls /var/run; ps -I | grep /usr/tavo/bin/ | grep -v grep")"
while IFS='|' read -r mode script wanted; do
    same "mode $mode" "$wanted" "$(inside "
        echo $mode >/var/standin/dms.mode
        $rc/S86tavodms.sh $script; echo \$? \$(cat /var/run/dms.pid 2>/dev/null | sed s/[0-9][0-9]*/N/) \$(ps -I | grep -c '[b]in/dms')" | tr '\n' ' ')"
done <<'END'
|start|0 N 1 
dies|start|1 0 
nopid|start|0 1 
garbage|start|0 not a number 1 
stale|start|0 N 1 
late|start|0 1 
END
same 'a daemon that ignores SIGTERM' '1 1' "$(inside "
    echo stubborn >/var/standin/dms.mode; $rc/S86tavodms.sh start; $rc/S86tavodms.sh stop; echo \$? \$(ps -I | grep -c '[b]in/dms')")"
same 'a script that fails, one with a hook' $'4\nhooked stop\n9' "$(inside "
    echo 4 >/var/standin/S04crond.sh.status; $rc/S04crond.sh start; echo \$?
    printf '#!/bin/sh\necho hooked \$1; exit 9\n' >/var/standin/S83nfsd.sh.hook; chmod 755 /var/standin/S83nfsd.sh.hook
    $rc/S83nfsd.sh stop; echo \$?")"

# A kernel thread has no arguments, so its name is in brackets; any other line is the pid and the arguments.
same 'a kernel thread' '[nfsd]' "$(inside "$rc/S83nfsd.sh start; ps -I | sed 's/^ *[0-9]* //' | grep nfsd | grep -v 'S83\|grep'")"
same 'one process, one line' '7 /tmp/sleep 100 a b 1' "$(inside '
    ln -s /bin/busybox /tmp/sleep
    /tmp/sleep 100 & pid=$!
    cp /bin/busybox /tmp/busybox; sh -c "exec -a x true" 2>/dev/null
    /bin/sh -c "sleep 0; sleep 50 #$(printf "a\nb")" & other=$!
    sleep 0.1
    /bin/ps -I >/tmp/list
    sed -n "s/^ *$pid /7 /p" /tmp/list | tr "\n" " "
    echo a b $(grep -c "^ *$other " /tmp/list)')"
same 'the common pipe' 1 "$(inside "$rc/S99ftpd.sh start; /bin/ps -I | /bin/grep 'ftpd' | grep -vc grep")"
