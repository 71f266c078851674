say 'Partitions: the layouts that the appliance has ever used, and today'\''s'
run tavoctl partition layout 2>/dev/null
if machine; then
    run tavoctl partition create --yes sda sdb sdc
    run tavoctl partition list sda
    run tavoctl partition layout sda
fi
