# shellcheck shell=sh
# The appliance inside the VM, sourced by the scenarios: its factory files at /, the real programs
# where the library runs them, the appliance bus, and both daemons from the build tree. wlan1 is
# moved into the namespace "sta", where the scenarios run their station. A scenario, given the
# source and build folders, starts with:
#   . "$1/tests/vm/appliance.sh"; start_appliance "$1" "$2" [kite-a]
# The Kite model line (kite-a) has the guest network and its bridge gbr0.

fail() {
    echo "FAIL: $*"
    for file in /tmp/vornnetd.log /tmp/vornwifid.log /run/vorn/rc.network/hostapd-wlan0.log \
        /var/run/hostapd-wlan0.conf /tmp/wpa.log; do
        [ -f "$file" ] && { echo "--- $file"; tail -n 25 "$file"; }
    done
    # Again last, where a shortened log still shows it.
    echo "FAIL: $*"
    exit 1
}

# waitfor TRIES COMMAND...: every 0.2 s until the command succeeds.
waitfor() {
    tries=$1
    shift
    while ! "$@" >/dev/null 2>&1; do
        tries=$((tries - 1))
        [ $tries -gt 0 ] || return 1
        sleep 0.2
    done
}

# apply_adapter IF CHANGES: ApplyAdapter with the adapter's configuration updated by CHANGES, the
# arguments of a Python dict().
apply_adapter() {
    config=$(vornwireless --get-adapter-config "$1" --compact) || fail "no configuration of $1"
    config=$(echo "$config" | python3 -c "import json, sys
c = json.load(sys.stdin)
c.update(dict($2))
print(json.dumps(c))")
    vornwireless --apply-adapter "$1" "$config" || fail "ApplyAdapter refused: $2"
}

# station [LINES]: a fresh wpa_supplicant in "sta", with a network block of LINES if given.
station() {
    [ -f /run/wpa.pid ] && kill "$(cat /run/wpa.pid)" && sleep 0.5
    printf 'ctrl_interface=/run/wpa_supplicant\nupdate_config=1\n' >/tmp/wpa.conf
    [ -z "${1:-}" ] || printf 'network={\n%s\n\tscan_freq=2437\n}\n' "$1" >>/tmp/wpa.conf
    ip netns exec sta wpa_supplicant -B -t -f /tmp/wpa.log -P /run/wpa.pid -D nl80211 -i wlan1 \
        -c /tmp/wpa.conf || fail "wpa_supplicant did not start"
}

wpa() { ip netns exec sta wpa_cli -p /run/wpa_supplicant -i wlan1 "$@"; }
associated() { wpa status | grep -q wpa_state=COMPLETED; }

# lease SUBNET: the station's address from DHCP, which must lie in SUBNET (a prefix like "10.0.0.").
lease() {
    ip netns exec sta ip addr flush dev wlan1
    ip netns exec sta busybox udhcpc -f -q -n -i wlan1 -s /bin/true >/tmp/udhcpc.log 2>&1 ||
        fail "no lease: $(cat /tmp/udhcpc.log)"
    address=$(sed -n 's/.*lease of \([0-9.]*\) obtained.*/\1/p' /tmp/udhcpc.log)
    case $address in "$1"*) ;; *) fail "lease outside $1: '$address'" ;; esac
    ip netns exec sta ip addr add "$address/24" dev wlan1
    ip netns exec sta ip route add default via "${1}1"
}

now() { cut -d' ' -f1 /proc/uptime; }
since() { awk -v a="$1" '{ printf "%.1f", $1 - a }' /proc/uptime; }

# beacon SSID: whether the station's radio hears the access point SSID.
beacon() { ip netns exec sta iw dev wlan1 scan freq 2437 | grep -q "SSID: $1\$"; }

psk='	ssid="vorn-vm"
	key_mgmt=WPA-PSK
	psk="vorn-secret-123"'

# The access point "vorn-vm" (WPA2-PSK) on wlan0, timed to its first beacon, and a station in it.
serve_and_join() {
    start=$(now)
    apply_adapter wlan0 'enabled=True, ssid="vorn-vm", mode="g", security="PERSONAL_WPA2",
        encryption="AES", password="vorn-secret-123", channel=6'
    waitfor 100 beacon vorn-vm || fail "no beacon of vorn-vm"
    echo "first beacon $(since "$start") s after the ApplyAdapter call"
    station "$psk"
    waitfor 100 associated || fail "the station did not associate"
}

reaches() { ip netns exec sta busybox ping -c 1 -W 2 "$1" >/dev/null; }

start_appliance() {
    source=$1
    build=$2
    ip netns add sta || fail "no namespace for the station"
    iw phy "$(cat /sys/class/net/wlan1/phy80211/name)" set netns name sta ||
        fail "cannot move wlan1 into its namespace"
    ip netns exec sta ip link set lo up
    ip netns exec sta ip link set wlan1 up
    mkdir -p /var/spool/cron/crontabs /var/packages/Linkyard/target/data
    for folder in etc etc.defaults usr; do
        cp -R "$source/sim/root/$folder" /
    done
    if [ "${3:-}" = kite-a ]; then
        echo 'model="kite-a"' >>/etc.defaults/vorninfo.conf
        cp /usr/vorn/etc.defaults/wifi/wifi_topology_router_kite /usr/vorn/etc/wifi/wifi_topology_router
    fi
    mkdir -p /usr/vorn/sbin /usr/vorn/bin /lib/udev/script /usr/vorn/etc/rc.d /run/vorn
    # The platform's iwlist takes wireless-tools' place, which it hands what it does not answer.
    mv /sbin/iwlist /sbin/iwlist.distrib
    for link in "$source/src/platform/rc.network:/etc/rc.network" /usr/sbin/brctl:/usr/vorn/sbin/brctl \
        "$source/src/platform/iwlist:/sbin/iwlist" "$source/src/platform/stop:/sbin/stop" \
        /usr/sbin/hostapd_cli:/usr/bin/hostapd_cli /usr/sbin/ethtool:/usr/vorn/bin/ethtool \
        "$build/tools/vornnetdtool:/usr/vorn/sbin/vornnetdtool" \
        "$build/tools/vornwireless:/usr/vorn/bin/vornwireless"; do
        ln -sf "${link%%:*}" "${link#*:}"
    done
    # What the appliance's other packages do there has no part in these scenarios.
    for script in /usr/vorn/etc/iptables_guest_net.sh /lib/udev/script/usb-wifi-util.sh \
        /usr/vorn/etc/rc.d/S98upnpd.sh; do
        printf '#!/bin/sh\nexit 0\n' >"$script"
        chmod 755 "$script"
    done
    export DBUS_SESSION_BUS_ADDRESS=unix:path=/run/vorn/bus
    dbus-daemon --session --fork --address="$DBUS_SESSION_BUS_ADDRESS" || fail "no bus"
    export ASAN_OPTIONS=detect_leaks=0
    "$build/daemons/vornnetd" --foreground >/tmp/vornnetd.log 2>&1 &
    waitfor 150 "$build/tools/vornnetdtool" --ready || fail "vornnetd did not come up"
    start_vornwifid
    PATH=$build/tools:$PATH
}

# call METHOD STRING...: a method of vornwifid through gdbus, which waits 300 s: under emulation a
# switch or a join takes about as long as the clients' default wait of 25 s.
call() {
    python3 - "$@" <<'PY'
import subprocess, sys
strings = ["'" + a.replace("\\", "\\\\").replace("'", "\\'") + "'" for a in sys.argv[2:]]
sys.exit(subprocess.call(["gdbus", "call", "--session", "--timeout", "300", "--dest",
                          "com.tessarin.wifi", "--object-path", "/", "--method",
                          "com.tessarin.wifi." + sys.argv[1]] + strings))
PY
}

# Starts vornwifid (its pid in $vornwifid) and waits until it answers.
start_vornwifid() {
    "$build/daemons/vornwifid" --foreground >>/tmp/vornwifid.log 2>&1 &
    # shellcheck disable=SC2034 # the scenarios stop it
    vornwifid=$!
    waitfor 300 "$build/tools/vornwireless" --ready || fail "vornwifid did not come up"
}
