#!/usr/bin/env bash
# Builds the provider and runs it as an object manager would, through its
# exported factories, against a BMC: OpenIPMI's BMC simulator on 127.0.0.1,
# reached over IPMI 2.0 LAN (RMCP+) and seeded with the sample SEL's
# records. Enumerate the log and its entries, get one entry by its path,
# clear the log and look again. The simulator is stopped by its PID at the
# end, also when a step fails.
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
stop_simulator() {
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

# The in-memory sample SEL needs no BMC: a configuration without a source
# (or source = memory) uses it.
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
