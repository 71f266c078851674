if machine; then
    say 'Quotas: how much a user may keep on a volume'
    run tavoctl quota on 1
    run tavoctl quota set anna 1 20M
    run tavoctl quota report
else
    say 'Quotas need a file system of their own, which memory is not: the failure says so'
    expect 1 tavoctl quota on 1
fi
