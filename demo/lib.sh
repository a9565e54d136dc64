# Shared by the demo scripts: sourced after `cd` to the project's top folder, with BUILD set.
# Keeps its scratch folder in WORK and stops what it started when the script exits.

WORK=$(mktemp -d "${TMPDIR:-/tmp}/vorn-demo-XXXXXX")
BUS_PID=
DAEMON_PID=
WIFID_PID=

section() { printf '\n=== %s\n' "$*"; }

cleanup() {
    local pid
    for pid in "$WIFID_PID" "$DAEMON_PID"; do
        if [ -n "$pid" ] && kill -0 "$pid" 2>/dev/null; then
            kill -TERM "$pid" 2>/dev/null || true
            wait "$pid" 2>/dev/null || true
        fi
    done
    if [ -n "$BUS_PID" ]; then
        kill -TERM "$BUS_PID" 2>/dev/null || true
        wait "$BUS_PID" 2>/dev/null || true
    fi
    rm -rf "$WORK"
}
trap cleanup EXIT

# Polls a command (up to 20 s) until it succeeds.
wait_until() {
    local tries=200
    until "$@" >/dev/null 2>&1; do
        tries=$((tries - 1))
        if [ "$tries" -eq 0 ]; then
            echo "gave up waiting for: $*" >&2
            return 1
        fi
        sleep 0.1
    done
}

gone() { ! kill -0 "$1"; }

# Shows a command, its output and its exit status; a failing command does not stop the demo.
show() {
    printf '\n$'
    local word
    for word in "$@"; do
        if [[ $word =~ ^[A-Za-z0-9_./:=,@%+-]+$ ]]; then
            printf ' %s' "$word"
        else
            printf " '%s'" "${word//\'/\'\\\'\'}"
        fi
    done
    printf '\n'
    local status=0
    "$@" 2>&1 || status=$?
    printf '(exit %d)\n' "$status"
}

# Configures BUILD without sanitizers and tests and builds the given targets; the log is shown
# only when it fails.
build_targets() {
    section "Build (cmake -B $BUILD, no sanitizers): $*"
    local generator=()
    if command -v ninja >/dev/null; then
        generator=(-G Ninja)
    fi
    if ! cmake -S . -B "$BUILD" "${generator[@]}" -DCMAKE_BUILD_TYPE=RelWithDebInfo \
        -DVORN_SANITIZE=OFF -DVORN_BUILD_TESTS=OFF >"$WORK/build.log" 2>&1 ||
        ! cmake --build "$BUILD" --target "$@" -j "$(nproc)" >>"$WORK/build.log" 2>&1; then
        cat "$WORK/build.log" >&2
        exit 1
    fi
}

# A private session bus for this script and the programs it starts.
start_bus() {
    section "A private session bus"
    dbus-daemon --session --nofork --print-address=3 3>"$WORK/bus-address" 2>/dev/null &
    BUS_PID=$!
    wait_until test -s "$WORK/bus-address"
    DBUS_SESSION_BUS_ADDRESS=$(head -n 1 "$WORK/bus-address")
    export DBUS_SESSION_BUS_ADDRESS
    echo "DBUS_SESSION_BUS_ADDRESS=$DBUS_SESSION_BUS_ADDRESS"
}

# vornnetd of BUILD in the foreground on that bus, its log in WORK/vornnetd.log; returns once it
# answers.
start_vornnetd() {
    section "vornnetd in the foreground (its log goes to $WORK/vornnetd.log)"
    "$PWD/$BUILD/daemons/vornnetd" --foreground 2>"$WORK/vornnetd.log" &
    DAEMON_PID=$!
    wait_until "$PWD/$BUILD/tools/vornnetdtool" --ready
}

# vornwifid of BUILD in the foreground on that bus (after vornnetd: its bridges announce their
# gateway records there), its log in WORK/vornwifid.log; returns once it answers.
start_vornwifid() {
    section "vornwifid in the foreground (its log goes to $WORK/vornwifid.log)"
    "$PWD/$BUILD/daemons/vornwifid" --foreground 2>"$WORK/vornwifid.log" &
    WIFID_PID=$!
    wait_until "$PWD/$BUILD/tools/vornwireless" --ready
}

# Stops a daemon with SIGTERM and shows its exit status.
stop_daemon() {
    local name=$1 pid=$2 status=0
    kill -TERM "$pid"
    wait_until gone "$pid" || kill -KILL "$pid"
    wait "$pid" || status=$?
    echo "$name exited with status $status"
}
