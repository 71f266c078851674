say 'Services: enabling binds the data folders, sets the key and starts the daemon'
run tavoctl service enable --dry-run media
run tavoctl service enable --wait 10 media web samba ftp
run tavoctl service list
run ls -l /var/services
run tavoctl service status web
expect 3 tavoctl service status telnet

say 'The database servers: what builds on them stops first and starts last'
run tavoctl service start DB
rm -f /var/standin/rc.log
run tavoctl service restart DB
run grep -v = /var/standin/rc.log
run tavoctl service stop DB

say 'Services outlive the loss of their volume: the links stay, and come to life with it'
tavoctl service stop web media
volume_away
run tavoctl service status --json web || true
volume_back
run tavoctl service restore /volume1
run tavoctl service list --volume /volume1
run tavoctl service disable media web samba ftp
run ls /volume1
