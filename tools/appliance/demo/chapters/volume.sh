say 'A volume: a file system on the array, where services and users keep their data'
if machine; then
    run tavoctl volume create --yes 1 md2
    volume_back() { run tavoctl volume mount 1; }
    volume_away() { run tavoctl volume unmount 1; }
else
    # Memory stands in for the array; it keeps what is on it while the volume is away.
    mkdir -p /volume1 /tmp/array
    mount -t tmpfs -o size=64m array /tmp/array
    volume_back() { run mount -o bind /tmp/array /volume1; }
    volume_away() { run umount /volume1; }
    volume_back
fi
run grep /volume1 /proc/mounts
