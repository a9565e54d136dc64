#!/bin/sh
# Topology round trip router -> bridge -> router with a station on the access point: after each
# switch the bridge, its slaves and the access point are as the topology says and the station is
# back. Then guarded switches: a confirmed one stays, one that nobody confirms goes back.
set -u
. "$1/tests/vm/appliance.sh"
start_appliance "$1" "$2"
# The plain bridge takes over the wired port's static address.
printf 'DEVICE=eth0\nBOOTPROTO=static\nIPADDR=192.168.1.10\nNETMASK=255.255.255.0\nONBOOT=yes\n' \
    >/etc/sysconfig/network-scripts/ifcfg-eth0
{ ip link add eth0 type dummy && ip link set eth0 up; } || fail "no wired interface"
serve_and_join

# in_topology BRIDGE OTHER: BRIDGE holds the access point, OTHER not, the station is back.
in_topology() {
    vornwireless --get-bridge-list --compact | grep -q "\"ifname\":\"$1\"" ||
        fail "bridge list: $(vornwireless --get-bridge-list --compact)"
    grep -qx "bridge=$1" /var/run/hostapd-wlan0.conf || fail "hostapd not on $1"
    waitfor 50 sh -c "ip link show master $1 | grep -q ' wlan0:'" ||
        fail "wlan0 not in $1: $(ip link show master "$1")"
    ! ip link show master "$2" 2>/dev/null | grep -q ' wlan0:' || fail "wlan0 still in $2"
    # A station that missed the restarted access point retries after a scan cycle of about 20 s.
    waitfor 400 associated || fail "the station did not come back in $1"
}

# The guarded switches below go through vornwireless, whose guard waits as long as gdbus here.
switch_to() { call SwitchTopology "$1" >/dev/null || fail "SwitchTopology $1 refused"; }

start=$(now)
switch_to bridge
echo "SwitchTopology bridge answered after $(since "$start") s"
in_topology br0 lbr0
ip link show master br0 | grep -q ' eth0:' || fail "eth0 not in br0"
switch_to router
in_topology lbr0 br0
echo "PASS: router -> bridge -> router, station back after $(since "$start") s"

vornwireless --switch-topology bridge --confirm-within 300 >/tmp/guard.log 2>&1 &
waitfor 300 grep -q -- --confirm /tmp/guard.log || fail "guard: $(cat /tmp/guard.log)"
vornwireless --confirm || fail "--confirm refused"
wait $! || fail "a confirmed switch did not stay: $(cat /tmp/guard.log)"
in_topology br0 lbr0
vornwireless --switch-topology router --confirm-within 3 >/dev/null 2>/tmp/guard.log &&
    fail "an unconfirmed switch stayed"
grep -q "switched back to bridge" /tmp/guard.log || fail "guard: $(cat /tmp/guard.log)"
in_topology br0 lbr0
echo "PASS: a confirmed switch stays, an unconfirmed one goes back"
