say 'Partitions: the layouts that the appliance has ever used, and today'\''s'
run tavoctl partition layout 2>/dev/null
if machine; then
    for disk in sda sdb sdc; do
        run tavoctl partition create --yes --system "$disk"
        run tavoctl partition create --yes --data "$disk"
    done
    run tavoctl partition list sda
    run tavoctl partition layout sda
fi
