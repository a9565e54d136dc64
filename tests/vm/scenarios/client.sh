#!/bin/sh
# Client topology: the appliance's wlan0 finds an upstream access point (real hostapd on wlan1,
# WPA2-PSK, with a DHCP server) through ScanNetworks, joins it through ApplyAdapter, takes its
# address by DHCP, and vornnetd installs the default route through the upstream gateway.
set -u
. "$1/tests/vm/appliance.sh"
start_appliance "$1" "$2"

printf 'interface=wlan1\ndriver=nl80211\nssid=vorn up\nhw_mode=g\nchannel=6\nieee80211n=1
wpa=2\nwpa_key_mgmt=WPA-PSK\nrsn_pairwise=CCMP\nwpa_passphrase=vorn-upstream-1\n' >/tmp/up.conf
ip netns exec sta hostapd -B -P /run/up-hostapd.pid /tmp/up.conf >/tmp/up.log 2>&1 ||
    fail "no upstream access point: $(cat /tmp/up.log)"
ip netns exec sta ip addr add 10.9.0.1/24 dev wlan1
ip netns exec sta dnsmasq --conf-file=/dev/null --port=0 --interface=wlan1 --bind-interfaces \
    --dhcp-range=10.9.0.50,10.9.0.99,1h --dhcp-option=3,10.9.0.1 --dhcp-option=6,10.9.0.1 \
    --dhcp-leasefile=/tmp/up.leases --pid-file=/run/up-dnsmasq.pid || fail "no upstream DHCP server"

start=$(now)
call SwitchTopology client >/dev/null || fail "SwitchTopology client refused"
echo "SwitchTopology client answered after $(since "$start") s"
grep -qx 'net_topology="client"' /etc/vorninfo.conf || fail "vorninfo: $(cat /etc/vorninfo.conf)"
[ ! -e /var/run/hostapd-wlan0.pid ] || fail "the appliance's access point still runs"

# The upstream network as ScanNetworks lists it, with the passphrase added: the station to join.
scan() { vornwireless --scan-networks wlan0 --compact >/tmp/scan.json && grep -q 'vorn up' /tmp/scan.json; }
waitfor 20 scan || fail "ScanNetworks: $(cat /tmp/scan.json)"
config=$(vornwireless --get-adapter-config wlan0 --compact) || fail "no configuration of wlan0"
config=$(python3 - "$config" <<'PY'
import json, sys
found = json.load(open("/tmp/scan.json"))
stations = next(v for v in found.values() if isinstance(v, list)) if isinstance(found, dict) else found
up = next(s for s in stations if s["essid"] == "vorn up")
assert (up["security"], up["encryption"], up["channel"], up["hwmode"]) == \
    ("PERSONAL_WPA2", "AES", 6, "bgn"), up
del up["signal"]
up["password"] = "vorn-upstream-1"
config = json.loads(sys.argv[1])
config.update(clientenabled=True, stations=[up])
print(json.dumps(config))
PY
) || fail "the scan's entry: $(cat /tmp/scan.json)"

start=$(now)
call ApplyAdapter wlan0 "$config" >/dev/null || fail "ApplyAdapter with the station refused"
echo "joined with an address $(since "$start") s after the ApplyAdapter call"
ip -4 addr show dev wlan0 | grep -q 'inet 10\.9\.0\.' || fail "wlan0: $(ip -4 addr show dev wlan0)"
waitfor 50 sh -c "ip route show default | grep -q 'via 10.9.0.1 dev wlan0'" ||
    fail "default route: $(ip route show default)"
vornnetdtool --get-gateway-list v4 --compact | grep -q '"gateway":"10.9.0.1"' ||
    fail "gateway list: $(vornnetdtool --get-gateway-list v4 --compact)"
busybox ping -c 1 -W 2 10.9.0.1 >/dev/null || fail "the upstream gateway does not answer"
vornwireless --get-connected-ap-info wlan0 --compact | grep -q '"ip":"10.9.0.' ||
    fail "GetConnectedAPInfo: $(vornwireless --get-connected-ap-info wlan0 --compact)"
echo "PASS: client topology, wlan0 at $(ip -4 -o addr show dev wlan0 | awk '{ print $4 }') via 10.9.0.1"
