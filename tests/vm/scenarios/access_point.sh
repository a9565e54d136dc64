#!/bin/sh
# The access point in router topology, real hostapd against a real station:
# 1. WPA2-PSK: the station associates, gets a lease from lbr0's DHCP server, reaches the
#    appliance; GetConnectionList and vornnetd's device list show it.
# 2. The guest network on the same radio: an address in gbr0's subnet and no way into lbr0's.
# 3. MAC filter: "deny" with the station's MAC keeps it out, "allow" with it lets it in.
# 4. WPS push button: the station joins without knowing the passphrase.
# 5. Schedules: with the access point scheduled for this hour only, vornwifid stops, the clock
#    moves on an hour, and vornwifid's start takes the access point down at once.
set -u
. "$1/tests/vm/appliance.sh"
start_appliance "$1" "$2" kite-a
serve_and_join
lease 192.168.100.
reaches 192.168.100.1 || fail "the station cannot reach lbr0"
mac=$(ip netns exec sta cat /sys/class/net/wlan1/address)
waitfor 50 sh -c "vornwireless --get-connection-list wlan0 --compact | grep -q '$address'" ||
    fail "GetConnectionList: $(vornwireless --get-connection-list wlan0 --compact)"
vornwireless --get-connection-list wlan0 --compact | grep -q "$mac" || fail "station MAC not listed"
waitfor 50 sh -c "vornnetdtool --get-device-list wifi --compact | grep -q '$mac'" ||
    fail "device list: $(vornnetdtool --get-device-list wifi --compact)"
echo "PASS 1: $mac at $address on the access point and in the device list"
nft list table ip vorn | grep -q 'ip saddr 192.168.100.0/24 oifname != .* masquerade' ||
    fail "no NAT: $(nft list ruleset)"
/etc/rc.network start-mesh wlan0 2>/dev/null
[ $? = 2 ] || fail "the network script took an unknown verb"
/etc/rc.network start-nat 'lbr0;reboot' 2>/dev/null
[ $? = 1 ] || fail "the network script took a bad interface name"

apply_adapter wlan0 'guest_enabled=True, guest_ssid="vorn-guest", guest_security="disabled",
    guest_allow_access_lan=False'
station '	ssid="vorn-guest"
	key_mgmt=NONE'
waitfor 100 associated || fail "the station did not join the guest network"
lease 192.168.200.
reaches 192.168.200.1 || fail "the guest station cannot reach gbr0"
! reaches 192.168.100.1 || fail "the guest network reaches lbr0"
apply_adapter wlan0 'guest_enabled=False'
echo "PASS 2: guest network at $address, lbr0 out of reach"

apply_adapter wlan0 "mac_filter_policy=\"deny\", mac_filter_rules=[dict(enable=True, desc=\"vm\", mac=\"$mac\")]"
station "$psk"
sleep 8
! associated || fail "a denied station associated"
apply_adapter wlan0 'mac_filter_policy="allow"'
station "$psk"
waitfor 100 associated || fail "an allowed station did not associate"
echo "PASS 3: MAC filter"

apply_adapter wlan0 'mac_filter_policy="deny", mac_filter_rules=[]'
station
vornwireless --enable-wps-pbc wlan0 || fail "EnableWPSWithPBC refused"
wpa wps_pbc >/dev/null || fail "wps_pbc refused"
waitfor 150 associated || fail "the station did not join by WPS"
echo "PASS 4: WPS push button"

hour=$(($(date +%w) * 24 + $(date +%-H)))
apply_adapter wlan0 "schedule_enabled=True,
    schedule=''.join('1' if hour == $hour else '0' for hour in range(168))"
waitfor 150 associated || fail "the station did not stay on the scheduled access point"
kill "$vornwifid" && wait "$vornwifid"
pidof hostapd >/dev/null || fail "the access point went down with vornwifid"
date -s "@$(($(date +%s) + 3600))" >/dev/null || fail "cannot move the clock"
start=$(now)
start_vornwifid
waitfor 150 sh -c '! pidof hostapd' || fail "the access point stayed up out of its hours"
echo "PASS 5: out of its hours the access point went down $(since "$start") s after vornwifid's start"
