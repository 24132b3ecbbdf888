#!/bin/sh
# Peak resident memory, wall time and CPU time (user + system) of selprov
# requests on a generated log, as a separate process the way an
# administrator runs it. On a busy machine the CPU time is the steadier
# figure. Needs GNU time (Debian package "time").
#
#   bench/selprov-rss.sh [entries] [build directory]
#
# Defaults: 65535 entries, build-release/ (cmake --preset release &&
# cmake --build --preset release --target selprov selfixture SELProvider).
# SELPROV=path/to/selprov runs another selprov binary on the same library,
# e.g. one built from an earlier commit.
set -eu
root=$(cd "$(dirname "$0")/.." && pwd)
entries=${1:-65535}
build=${2:-$root/build-release}
if [ ! -x /usr/bin/time ]; then
    echo "selprov-rss.sh: needs /usr/bin/time (apt-get install time)" >&2
    exit 2
fi
for tool in selfixture selprov; do
    if [ ! -x "$build/bin/$tool" ]; then
        echo "selprov-rss.sh: no $tool in $build/bin" >&2
        exit 2
    fi
done
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
"$build/bin/selfixture" "$entries" >"$work/log.fixture"
printf 'source = memory\nmemory.fixture = %s\nlog.sink = none\n' \
    "$work/log.fixture" >"$work/platform.conf"
selprov="${SELPROV:-$build/bin/selprov} --library $build/lib/libSELProvider.so --config $work/platform.conf"
entry=$($selprov enumerate-names ZAN_MgmtHwLogEntry | sed -n "$((entries / 2))p")

echo "selprov on a log of $entries entries: peak resident memory, wall time, CPU time"
run() {
    label=$1
    shift
    /usr/bin/time -f "%M %e %U %S" -o "$work/time" "$@" >/dev/null
    read -r kilobytes wall user system <"$work/time"
    printf '%-40s %6d MB %7.2f s wall %7.2f s CPU\n' "$label" \
        $((kilobytes / 1024)) "$wall" "$(awk "BEGIN { print $user + $system }")"
}
run "enumerate ZAN_MgmtHwLogEntry" $selprov enumerate ZAN_MgmtHwLogEntry
run "enumerate --json ZAN_MgmtHwLogEntry" $selprov --json enumerate ZAN_MgmtHwLogEntry
run "enumerate-names ZAN_MgmtHwLogEntry" $selprov enumerate-names ZAN_MgmtHwLogEntry
run "get (one entry)" $selprov get "$entry"
run "enumerate ZAN_MgmtHwLog (the log alone)" $selprov enumerate ZAN_MgmtHwLog
