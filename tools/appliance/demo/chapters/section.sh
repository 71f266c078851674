say 'Sections: files divided by [headers]'
cat >/tmp/share.conf <<'END'
[homes]
path=/volume1/homes
[photo]
# for everybody
path=/volume1/photo
ro=guest
END
run tavoctl section list --file /tmp/share.conf
run tavoctl section get --file /tmp/share.conf photo
run tavoctl section set --file /tmp/share.conf photo path=/volume2/photo rw=@users
run cat /tmp/share.conf
