#!/usr/bin/env bash
# Builds the provider and runs it as an object manager would, through its
# exported factories, against a BMC: OpenIPMI's BMC simulator on 127.0.0.1,
# reached over IPMI 2.0 LAN (RMCP+) and seeded with the sample SEL's
# records. Enumerate the log and its entries, get one entry by its path,
# clear the log and look again. Then indications: first raised by the
# in-memory source, then caused by real IPMI traffic to a second simulator
# (records added, the SEL cleared and filled, the watchdog expiring). The
# simulators and the watcher are stopped by their PIDs at the end, also
# when a step fails.
set -euo pipefail
cd "$(dirname "$0")/.."

tools/setup-deps.sh
mkdir -p build
if ! { cmake --preset default &&
       cmake --build --preset default --target SELProvider selprov bmcsim_tool; } \
        >build/main-job-build.log 2>&1; then
    cat build/main-job-build.log
    exit 1
fi

bmcsim=build/bin/bmcsim
bench=$(mktemp -d /tmp/selprov-bmc.XXXXXX)
alerts_bench="$bench/alerts"
watcher=""
stop_simulator() {
    if [[ -n $watcher ]]; then
        kill "$watcher" 2>/dev/null || true
        wait "$watcher" 2>/dev/null || true
    fi
    if [[ -f $alerts_bench/bmcsim.pid ]]; then
        "$bmcsim" stop --dir "$alerts_bench" || true
    fi
    "$bmcsim" stop --dir "$bench" || true
    rm -rf "$bench"
}
trap stop_simulator EXIT

# The simulator: a free UDP port, the project's lan.conf and emulator file,
# the sample SEL's 24 records, SEL clock set to now.
simulator=$("$bmcsim" start --dir "$bench" --sample --max-records 64)
host=$(sed -n 's/^host=//p' <<<"$simulator")
echo "BMC simulator: $host (pid $(sed -n 's/^pid=//p' <<<"$simulator"))"

# The platform configuration: the IPMI source over LAN 2.0. The password
# sits in its own file, readable by its owner only.
. tools/simulated-bmc-conf.sh
simulated_bmc_conf "$bench/platform.conf" "$host" "$bench" \
    "ipmi.cipher-suite = 3" "ipmi.timeout = 5000" "log.sink = stderr"

selprov=(build/bin/selprov --config "$bench/platform.conf")
run() {
    echo
    echo "\$ selprov $*"
    "${selprov[@]}" "$@"
}

run enumerate-names ZAN_MgmtHwLog
run enumerate ZAN_MgmtHwLog
run enumerate ZAN_MgmtHwLogEntry --properties RecordID,MessageTimestamp,Description,RecordData
entry=$("${selprov[@]}" enumerate-names ZAN_MgmtHwLogEntry | sed -n 5p)
run get "$entry"
# One process, so the cleared log is what the second request sees.
echo
echo "\$ selprov batch  (clear-log, then enumerate-names ZAN_MgmtHwLogEntry)"
printf 'clear-log\nenumerate-names ZAN_MgmtHwLogEntry\nenumerate ZAN_MgmtHwLog --properties CurrentNumberOfRecords\n' |
    "${selprov[@]}" batch
echo
echo "\$ ipmitool sel info  (the BMC's own view after ClearLog)"
ipmitool -I lanplus -H 127.0.0.1 -p "${host##*:}" -U admin -P password -C 3 \
    sel info | grep -E '^(Entries|Last Del Time)'

# The in-memory sample SEL needs no BMC, and is served only where a
# configuration says source = memory (without one the platform reads the
# server's own BMC in band).
echo
echo "\$ selprov --config memory.conf enumerate ZAN_MgmtHwLog --properties Name,CurrentNumberOfRecords"
printf 'source = memory\n' >"$bench/memory.conf"
build/bin/selprov --config "$bench/memory.conf" \
    enumerate ZAN_MgmtHwLog --properties Name,CurrentNumberOfRecords

# ---------------------------------------------------------------------------
# Indications, on the in-memory sample SEL whatever else the platform is
# configured for: subscribe to the four indication classes, have the
# simulated BMC raise each kind of alert, print the indications as they
# arrive, then unsubscribe.
# ---------------------------------------------------------------------------
memory_conf="$bench/indications.conf"
printf 'source = memory\nlog.sink = none\n' >"$memory_conf"
echo
echo "\$ selprov --config memory.conf watch --raise entry,clear,warning,full,restart --count 5 --timeout 30"
build/bin/selprov --config "$memory_conf" watch --raise entry,clear,warning,full,restart \
    --count 5 --timeout 30

# ---------------------------------------------------------------------------
# Indications caused by real IPMI traffic: selprov watch on the IPMI source,
# polling a second simulator (8-record SEL, empty) every 250 ms, while this
# script adds records, lets the watchdog expire (hard reset), clears the SEL
# and fills it: entry events, a restart event with cause "Watchdog", a clear
# event, then "Warning" at 6 records and "Critical" at 8.
# ---------------------------------------------------------------------------
mkdir -p "$alerts_bench"
alerts_sim=$("$bmcsim" start --dir "$alerts_bench" --max-records 8)
alerts_host=$(sed -n 's/^host=//p' <<<"$alerts_sim")
echo
echo "BMC simulator for alerts: $alerts_host (pid $(sed -n 's/^pid=//p' <<<"$alerts_sim"))"
alerts_conf="$alerts_bench/platform.conf"
sed -e "s|^ipmi.host = .*|ipmi.host = $alerts_host|" \
    -e "s|^ipmi.state-directory = .*|ipmi.state-directory = $alerts_bench/platform-state|" \
    -e "s|^log.sink = .*|log.sink = none|" \
    "$bench/platform.conf" >"$alerts_conf"
printf 'ipmi.poll-interval = 250\n' >>"$alerts_conf"
watch_ipmi=(build/bin/selprov --config "$alerts_conf" watch)

# A first short watch leaves what it saw in the state directory, so the
# real watcher announces everything added from here on, even what comes
# before its first poll.
"${watch_ipmi[@]}" --timeout 1 >/dev/null
echo "\$ selprov --config ipmi.conf watch --count 15 --timeout 60   (in the background)"
"${watch_ipmi[@]}" --count 15 --timeout 60 &
watcher=$!
step() {
    sleep 1.5
    echo "# $*"
}
step "bmcsim add --count 2: two records"
"$bmcsim" add --dir "$alerts_bench" --count 2
step "bmcsim watchdog: the watchdog expires after 1 s with a hard reset"
"$bmcsim" watchdog --dir "$alerts_bench" --tenths 10
step "bmcsim clear: the SEL is cleared"
"$bmcsim" clear --dir "$alerts_bench"
step "bmcsim add --count 4, then 2: six of eight records, the warning fill"
"$bmcsim" add --dir "$alerts_bench" --count 4
sleep 0.5
"$bmcsim" add --dir "$alerts_bench" --count 2
step "bmcsim add --count 2: the SEL is full"
"$bmcsim" add --dir "$alerts_bench" --count 2
watch_status=0
wait "$watcher" || watch_status=$?
watcher=""
if ((watch_status != 0)); then
    echo "selprov watch on the IPMI source ended with status $watch_status" >&2
    exit "$watch_status"
fi
