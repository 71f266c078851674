# The listening part of the daemon needs a user to become, and the second appliance a network of its own.
case ",${TAVO_ROOT_LACKS-}," in
*,uids,* | *,net,*) far= ;;
*) far=veth0 ;;
esac
if machine; then far=eth1; fi
if [ -d "/sys/class/net/${far:-none}" ]; then
    say 'Other appliances: findhostd answers them and lists who answers us'
    # At the other end of the cable.
    unshare -n -u -m sh -c 'mount -t tmpfs run /var/run && mount -t tmpfs tmp /tmp
        hostname cellar 2>/dev/null || echo cellar >/proc/sys/kernel/hostname
        echo $$ >/dev/shm/cellar
        until ifconfig '$far' 192.0.2.7 netmask 255.255.255.0 up 2>/dev/null; do sleep 0.1; done
        exec /usr/tavo/bin/findhostd --foreground' &
    until [ -s /dev/shm/cellar ]; do sleep 0.1; done
    ip link set $far netns "$(cat /dev/shm/cellar)"
    run /usr/tavo/bin/findhostd
    run tavoctl proc find findhostd
    expect 1 /usr/tavo/bin/findhostd
    run tavoctl discover
    run tavoctl discover --json
    kill $!
    wait || true
fi
