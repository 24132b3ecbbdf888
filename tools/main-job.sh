#!/usr/bin/env bash
# Builds the provider and runs it as an object manager would, through its
# exported factories, on the built-in sample SEL: enumerate the log and its
# entries, get one entry by its path, clear the log and look again.
set -euo pipefail
cd "$(dirname "$0")/.."

tools/setup-deps.sh
mkdir -p build
if ! { cmake --preset default && cmake --build --preset default --target SELProvider selprov; } \
        >build/main-job-build.log 2>&1; then
    cat build/main-job-build.log
    exit 1
fi

selprov=build/bin/selprov
run() {
    echo
    echo "\$ selprov $*"
    "$selprov" "$@"
}

run enumerate-names ZAN_MgmtHwLog
run enumerate ZAN_MgmtHwLog
run enumerate ZAN_MgmtHwLogEntry --properties RecordID,MessageTimestamp,Description,RecordData
entry=$("$selprov" enumerate-names ZAN_MgmtHwLogEntry | sed -n 5p)
run get "$entry"
# One process, so the cleared log is what the second request sees.
echo
echo "\$ selprov batch  (clear-log, then enumerate-names ZAN_MgmtHwLogEntry)"
printf 'clear-log\nenumerate-names ZAN_MgmtHwLogEntry\nenumerate ZAN_MgmtHwLog --properties CurrentNumberOfRecords\n' |
    "$selprov" batch

# ---------------------------------------------------------------------------
# Indications, on the in-memory sample SEL whatever else the platform is
# configured for: subscribe to the four indication classes, have the
# simulated BMC raise each kind of alert, print the indications as they
# arrive, then unsubscribe.
# ---------------------------------------------------------------------------
memory_conf=$(mktemp)
trap 'rm -f "$memory_conf"' EXIT
printf 'source = memory\nlog.sink = none\n' >"$memory_conf"
echo
echo "\$ selprov --config memory.conf watch --raise entry,clear,warning,full,restart --count 5 --timeout 30"
"$selprov" --config "$memory_conf" watch --raise entry,clear,warning,full,restart \
    --count 5 --timeout 30
