if machine; then
    say 'From six blank disks to a volume in three commands'
    for bay in 1 2 3 4 5 6; do
        appliance-event pull $bay
        appliance-event plug $bay --blank 4800
    done
    run tavoctl storage
    run tavoctl partition create --yes sda sdb sdc sdd sde sdf
    run tavoctl raid create --yes --level 6 md2 sda3 sdb3 sdc3 sdd3 sde3 sdf3
    run tavoctl volume create --yes 1 md2
    run tavoctl raid wait md2
    run tavoctl storage

    say 'A disk is pulled, and another one takes its place'
    run appliance-event pull 3
    date >/volume1/file && sync
    run tavoctl raid list
    run appliance-event plug 3 --blank 4800
    new=$(tavoctl disk list --noheadings --output bay,disk | awk '$1 == 3 { print $2 }')
    run tavoctl raid replace --yes --wait md2 "$new"
    run tavoctl storage

    say 'After a stop everything comes back by two commands'
    tavoctl volume unmount 1
    tavoctl raid stop --yes md2
    run tavoctl raid list --all
    run tavoctl raid assemble --all
    run tavoctl volume mount --all
    run tavoctl volume list
    tavoctl volume unmount 1
    tavoctl lvm remove --yes vg1
    tavoctl raid remove --yes md2
else
    say 'Storage: bays, and nothing in them here'
    run tavoctl storage
    run tavoctl volume list
fi
