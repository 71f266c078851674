say 'A volume: a file system on the array, where services and users keep their data'
mkdir -p /volume1
if machine; then
    volume=$(lvs --noheadings -o lv_path 2>/dev/null | head -1 | tr -d ' ')
    : "${volume:=$(ls /dev/md[2-9] 2>/dev/null | head -1)}"
    run mkfs.ext4 -q "$volume"
    volume_back() { run mount "$volume" /volume1; }
else
    # Memory stands in for the array; it keeps what is on it while the volume is away.
    mkdir -p /tmp/array
    mount -t tmpfs -o size=64m array /tmp/array
    volume_back() { run mount -o bind /tmp/array /volume1; }
fi
volume_away() { run umount /volume1; }
volume_back
run grep /volume1 /proc/mounts
