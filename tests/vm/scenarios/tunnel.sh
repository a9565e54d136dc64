#!/bin/sh
# 6in4: the IPv6 router of the WAN makes a real sit tunnel to the broker, and the route module
# takes it as the IPv6 default gateway; stopping the router removes the tunnel and its route.
set -u
. "$1/tests/vm/appliance.sh"
start_appliance "$1" "$2"
{ ip link add eth0 type dummy && ip link set eth0 up && ip addr add 198.51.100.2/24 dev eth0; } ||
    fail "no WAN"

vornnetdtool --set-ipv6-router '{"type": "6in4", "wan": "eth0", "is_default_gateway": true,
    "prefix": "2001:db8:1::/48", "remote_addr_v4": "198.51.100.1",
    "local_addr_v6": "2001:db8::2/64"}' || fail "the 6in4 router was refused"
tunnel=$(ip -o link show type sit | awk -F': ' '$2 !~ /^sit0/ { sub(/@.*/, "", $2); print $2 }')
[ -n "$tunnel" ] || fail "no tunnel: $(ip -d link show)"
ip -d link show "$tunnel" | grep -q "remote 198.51.100.1 local 198.51.100.2 ttl 255" ||
    fail "tunnel not as asked: $(ip -d link show "$tunnel")"
ip -6 addr show dev "$tunnel" | grep -q "2001:db8::2/64" || fail "no address on $tunnel"
waitfor 50 sh -c "ip -6 route show default | grep -q 'dev $tunnel'" ||
    fail "no default route through $tunnel: $(ip -6 route show default)"
echo "PASS: $tunnel up, the IPv6 default route through it"

vornnetdtool --stop-ipv6-router eth0 || fail "the router did not stop"
! ip link show "$tunnel" >/dev/null 2>&1 || fail "$tunnel is still there"
waitfor 50 sh -c "! ip -6 route show default | grep -q 'dev $tunnel'" || fail "its route stayed"
echo "PASS: $tunnel and its route gone"
