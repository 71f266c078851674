if machine; then
    say 'Disks: which bays are taken, by what, and how it is'
    run tavoctl disk list
    for bay in 1 2 3; do
        appliance-event pull $bay
        run appliance-event plug $bay --blank 4736
    done
    run tavoctl disk info sda
    run tavoctl disk cache sda on
else
    say 'Disks: none are here, so a file plays one for our sfdisk'
    run tavoctl disk list
    run truncate -s 8G /tmp/disk
    run sfdisk -M1 -q /tmp/disk
    run sfdisk -N1 -uS -j256 -z4980480 -tfd -F -q /tmp/disk
    run sfdisk -N2 -uS -j0 -z4194304 -tfd -F -q /tmp/disk
    run sfdisk -l -uS /tmp/disk
fi
expect 3 tavoctl disk info sdzz
