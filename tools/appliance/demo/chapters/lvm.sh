if machine; then
    say 'A volume group on the array, and the volume that fills it'
    run tavoctl lvm create --yes vg1 md2
    run tavoctl lvm list
    run tavoctl lvm remove --yes vg1
else
    say 'Volume groups, as the scripted tools tell of them'
    scenario begin
    echo '  /dev/md2|vg1|lSQfeY-dso4-NzXN-Hbdv-wh1J-WThm-cNRXi7|1' >/tmp/pvs
    scenario expect --stdout /tmp/pvs --times any -- /sbin/pvs ...
    scenario expect --times any -- pvs ...
    run tavoctl lvm list
    run cat /var/scenario/log
    scenario reset
fi
