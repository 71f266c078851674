if machine; then
    say 'An array of three disks: made, watched until it is in order, degraded and mended'
    run tavoctl raid create --yes --level 5 md2 sda3 sdb3 sdc3
    run tavoctl raid wait md2
    run tavoctl raid list
    run tavoctl raid superblock sda3 sdb3 sdc3
    run appliance-event pull 3
    echo x >/dev/md2
    run tavoctl raid list
    run appliance-event plug 3 --blank 4736
    new=$(tavoctl disk list --noheadings --output bay,disk | awk '$1 == 3 { print $2 }')
    run tavoctl raid replace --yes --wait md2 "$new"
    run tavoctl raid info md2
else
    say 'Arrays: mdadm is scripted here; what it says of two members is read all the same'
    superblock() { # MEMBER ROLE
        cat <<END
$1:
          Magic : a92b4efc
        Version : 1.2
     Array UUID : b7e9ed0e:bf1ea758:5bf5fba6:7c359649
           Name : nas:2  (local to host nas)
     Raid Level : raid5
   Raid Devices : 3
          State : clean
         Events : 19
   Device Role : Active device $2
   Array State : AA. ('A' == active, '.' == missing, 'R' == replacing)
END
    }
    scenario begin
    for member in 'sda3 0' 'sdb3 1'; do
        superblock "/dev/${member% *}" "${member#* }" >/tmp/superblock
        scenario expect --stdout /tmp/superblock -- /sbin/mdadm -E "/dev/${member% *}"
    done
    run tavoctl raid superblock sda3 sdb3
    run scenario check
    scenario reset
fi
