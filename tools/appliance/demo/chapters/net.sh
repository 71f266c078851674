say 'The network: what it is, and changes that are refused before anything happens'
run tavoctl net bonds
expect 2 tavoctl net set 192.0.2.300/24
expect 2 tavoctl net set --interface '../../shadow' 192.0.2.20/24
expect 3 tavoctl net confirm

# A plain root has no card of its own: two that are joined, one of them the appliance's.
card=eth0
machine || ip link add eth0 type veth 2>/dev/null || card=
if [ "$card" ] && { machine || ip link set veth0 up 2>/dev/null; }; then
    say 'An address, for good; and one on trial, which goes again because nobody confirms it'
    run ifconfig eth0 up
    run tavoctl net set --interface eth0 192.0.2.10/24 --gateway 192.0.2.1
    run tavoctl net dns 192.0.2.53
    run tavoctl net hostname attic
    run tavoctl net mtu eth0 1400
    run tavoctl net ipv6 eth0 2001:db8::10/64
    run tavoctl net show
    expect 1 tavoctl net set --interface eth0 --try 2 192.0.2.99/24
    run ip -4 addr show dev eth0
    run cat /etc/sysconfig/network-scripts/ifcfg-eth0
fi
