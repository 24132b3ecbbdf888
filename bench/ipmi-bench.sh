#!/usr/bin/env bash
# Times the provider on OpenIPMI's BMC simulator against FreeIPMI's ipmi-sel
# and ipmitool, on the same simulated SEL in the same run, and prints each
# result as a ratio to ipmi-sel. Run by hand (not in CI), after a build:
#
#   cmake --preset default && cmake --build --preset default
#   bench/ipmi-bench.sh [RUNS]
#
# For 1,000 and 5,000 records: ipmi-sel (LAN 2.0), ipmitool sel elist, the
# provider's EnumerateInstances of ZAN_MgmtHwLogEntry through the host in a
# new selprov process (cold: the SEL copy kept by the run before removed)
# and as the second request of one selprov batch
# (warm, unchanged SEL; selprov --timing), the same warm request on the
# in-memory source with the same number of entries (what the layers above
# the platform cost on their own), the warm EnumerateInstances of
# ZAN_MgmtHwLog (one instance: mostly the IPMI source's own cost), and on
# 5,000 records both requests right after 10 records were added.
#
# Then the restart case at 3,000 records: a new selprov process that finds
# the SEL copy an earlier process kept (ipmi.state-directory) against an
# unchanged SEL, against 10 records added since, and right after a clear,
# beside a cold process without a kept copy and ipmi-sel in the same run;
# each with the IPMI requests the process sent after its session opened
# (the session's counter, as selprov --timing prints it).
# With BENCH_SEL_DELAY_MS=N the restart table is made again on a simulator
# that answers every SEL command N ms late (bmcsim --sel-delay-ms), as a
# real BMC over a LAN does; session set-up and the other commands are not
# delayed, for either tool.
# Each figure is the median of RUNS runs (default 3). BENCH_PART=restart
# runs the restart table alone, BENCH_PART=read the first one alone.
set -euo pipefail
cd "$(dirname "$0")/.."

. tools/simulated-bmc-conf.sh

runs=${1:-3}
bin=build/bin
for tool in selprov bmcsim selfixture; do
    [[ -x $bin/$tool ]] || { echo "build first: $bin/$tool missing" >&2; exit 1; }
done
for tool in ipmi_sim ipmi-sel ipmitool; do
    command -v "$tool" >/dev/null || { echo "$tool is not installed" >&2; exit 1; }
done

bench=$(mktemp -d /tmp/selprov-ipmi-bench.XXXXXX)
cleanup() {
    "$bin/bmcsim" stop --dir "$bench/sim" >/dev/null 2>&1 || true
    rm -rf "$bench"
}
trap cleanup EXIT

now() { date +%s.%N; }
median() { sort -g | awk '{ v[NR] = $1 } END { print v[int((NR + 1) / 2)] }'; }

# Seconds of one run of a command line (output discarded).
seconds() {
    local start end
    start=$(now)
    "$@" >/dev/null 2>&1
    end=$(now)
    echo "$end - $start" | bc -l
}
median_seconds() {
    for ((i = 0; i < runs; i++)); do seconds "$@"; done | median
}

# The time selprov --timing gives for the N-th request of a batch, in s.
nth_request() {
    local n=$1
    sed -n 's/^selprov: request took \([0-9.]*\) ms$/\1/p' | sed -n "${n}p" |
        awk '{ printf "%.6f\n", $1 / 1000 }'
}

warm_request() { # config class
    for ((i = 0; i < runs; i++)); do
        printf 'enumerate %s\nenumerate %s\n' "$2" "$2" |
            "$bin/selprov" --config "$1" --timing batch 2>&1 >/dev/null |
            nth_request 2
    done | median
}

# The second request of a batch that finds 10 records added after the first.
ten_new_records() { # config class
    for ((i = 0; i < runs; i++)); do
        local fifo=$bench/requests timing=$bench/timing
        rm -f "$fifo" "$timing"
        mkfifo "$fifo"
        "$bin/selprov" --config "$1" --timing batch <"$fifo" >/dev/null 2>"$timing" &
        local pid=$!
        exec 3>"$fifo"
        echo "enumerate $2" >&3
        for ((wait = 0; wait < 600; wait++)); do
            grep -q 'request took' "$timing" && break
            sleep 0.05
        done
        "$bin/bmcsim" add --dir "$bench/sim" --count 10
        echo "enumerate $2" >&3
        exec 3>&-
        wait "$pid"
        nth_request 2 <"$timing"
    done | median
}

ratio() { echo "scale=4; $1 / $2" | bc -l; }
row() { # what records seconds reference
    printf '| %-52s | %6s | %10.3f | %8.4fx |\n' "$1" "$2" \
        "$(echo "$3 * 1000" | bc -l)" "$(ratio "$3" "$4")"
}

part=${BENCH_PART:-all}

# Without the SEL copy an earlier process kept: a cold start.
drop_copy() { rm -f "$bench"/platform-state/sel-copy-*; }
cold_selprov() { drop_copy; "$bin/selprov" "$@"; }

# Starts the simulator with N records (and further bmcsim start options)
# and writes the IPMI configuration; sets host and port.
start_simulator() { # records [option...]
    local count=$1
    shift
    "$bin/bmcsim" stop --dir "$bench/sim" >/dev/null 2>&1 || true
    rm -rf "$bench/sim" "$bench/platform-state"
    mkdir -p "$bench/sim"
    # Room for the records and the ones added later, below 4096 free
    # records so that the 16-bit free-space field does not wrap.
    local simulator
    simulator=$("$bin/bmcsim" start --dir "$bench/sim" --generate "$count" \
        --max-records $((count + 100)) "$@")
    host=$(sed -n 's/^host=//p' <<<"$simulator")
    port=${host##*:}
    simulated_bmc_conf "$bench/ipmi.conf" "$host" "$bench" "log.sink = none"
}

if [[ $part != restart ]]; then
echo "| measurement | records | ms | vs ipmi-sel |"
echo "|---|---|---|---|"
for records in 1000 5000; do
    start_simulator "$records"
    "$bin/selfixture" "$records" >"$bench/memory.fixture"
    printf 'source = memory\nmemory.fixture = %s\nlog.sink = none\n' \
        "$bench/memory.fixture" >"$bench/memory.conf"

    ipmisel=(ipmi-sel -D LAN_2_0 -h "$host" -u admin -p password -l ADMIN
             -W opensesspriv --sdr-cache-directory="$bench/sdrcache"
             --quiet-cache)
    ipmitool=(ipmitool -I lanplus -H 127.0.0.1 -p "$port" -U admin
              -P password -C 3)
    selprov=("$bin/selprov" --config "$bench/ipmi.conf")

    # Untimed first runs build both SDR caches.
    mkdir -p "$bench/sdrcache"
    "${ipmisel[@]}" --sdr-cache-recreate >/dev/null 2>&1
    "${selprov[@]}" enumerate-names ZAN_MgmtHwLog >/dev/null

    reference=$(median_seconds "${ipmisel[@]}")
    row "ipmi-sel (FreeIPMI, LAN 2.0)" "$records" "$reference" "$reference"
    row "ipmitool sel elist" "$records" \
        "$(median_seconds "${ipmitool[@]}" sel elist)" "$reference"
    row "selprov enumerate, cold (new process, no kept copy)" "$records" \
        "$(median_seconds cold_selprov --config "$bench/ipmi.conf" \
            enumerate ZAN_MgmtHwLogEntry)" "$reference"
    row "selprov enumerate the log, cold (no kept copy)" "$records" \
        "$(median_seconds cold_selprov --config "$bench/ipmi.conf" \
            enumerate ZAN_MgmtHwLog)" "$reference"
    for class in ZAN_MgmtHwLogEntry ZAN_MgmtHwLog; do
        what=entries
        [[ $class == ZAN_MgmtHwLog ]] && what="the log"
        row "Enumerate $what, warm (2nd request of a batch)" "$records" \
            "$(warm_request "$bench/ipmi.conf" "$class")" "$reference"
        row "  the same on the in-memory source" "$records" \
            "$(warm_request "$bench/memory.conf" "$class")" "$reference"
    done
    if ((records == 5000)); then
        row "Enumerate entries after 10 new records" "$records" \
            "$(ten_new_records "$bench/ipmi.conf" ZAN_MgmtHwLogEntry)" \
            "$reference"
        row "Enumerate the log after 10 new records" "$records" \
            "$(ten_new_records "$bench/ipmi.conf" ZAN_MgmtHwLog)" "$reference"
    fi
done
fi
[[ $part == read ]] && exit 0

# One new selprov process: "seconds requests" (wall time, and the IPMI
# requests it sent after its session opened).
restart_run() { # config
    local start end requests
    start=$(now)
    "$bin/selprov" --config "$1" --timing enumerate ZAN_MgmtHwLogEntry \
        >/dev/null 2>"$bench/timing"
    end=$(now)
    requests=$(sed -n 's/^selprov: IPMI requests so far \([0-9]*\)$/\1/p' \
        "$bench/timing" | tail -n 1)
    echo "$(echo "$end - $start" | bc -l) ${requests:-?}"
}
# The median run of RUNS, each after "$@" (a command run untimed first).
restart_median() { # config command...
    local config=$1
    shift
    for ((i = 0; i < runs; i++)); do
        "$@" </dev/null
        restart_run "$config" </dev/null
    done | sort -g | awk '{ l[NR] = $0 } END { print l[int((NR + 1) / 2)] }'
}
restart_row() { # what records "seconds requests" reference
    local seconds=${3% *} requests=${3#* }
    printf '| %-46s | %6s | %8s | %10.3f | %9.4fx | %8.1fx |\n' "$1" "$2" \
        "$requests" "$(echo "$seconds * 1000" | bc -l)" \
        "$(ratio "$seconds" "$4")" "$(ratio "$4" "$seconds")"
}
nothing() { :; }
add_ten() { "$bin/bmcsim" add --dir "$bench/sim" --count 10; }
clear_sel() { "$bin/bmcsim" clear --dir "$bench/sim"; }

# The restart table on a simulator started with the bmcsim options given.
restart_table() { # title option...
    local title=$1
    shift
    start_simulator "$records" "$@"
    ipmisel=(ipmi-sel -D LAN_2_0 -h "$host" -u admin -p password -l ADMIN
             -W opensesspriv --sdr-cache-directory="$bench/sdrcache"
             --quiet-cache)
    mkdir -p "$bench/sdrcache"
    "${ipmisel[@]}" --sdr-cache-recreate >/dev/null 2>&1
    # Builds selprov's SDR cache.
    "$bin/selprov" --config "$bench/ipmi.conf" enumerate-names ZAN_MgmtHwLog \
        >/dev/null
    local reference
    reference=$(median_seconds "${ipmisel[@]}")

    echo
    echo "$title"
    echo
    echo "| new selprov process (enumerate entries) | records | requests | ms | vs ipmi-sel | faster |"
    echo "|---|---|---|---|---|---|"
    restart_row "ipmi-sel (FreeIPMI, LAN 2.0)" "$records" "$reference -" \
        "$reference"
    # Each setup runs before every timed run; the cold runs keep the copy
    # that the first restart row then finds.
    local label count setup
    while IFS='|' read -r label count setup; do
        restart_row "$label" "$count" \
            "$(restart_median "$bench/ipmi.conf" "$setup")" "$reference"
    done <<EOF
cold: no kept copy|$records|drop_copy
restart, unchanged SEL|$records|nothing
restart, 10 records added meanwhile|$records+10|add_ten
restart after a clear|0|clear_sel
EOF
}

records=3000
restart_table "Loopback: the simulator answers at once."
if [[ -n ${BENCH_SEL_DELAY_MS:-} ]]; then
    restart_table "Every SEL command answered ${BENCH_SEL_DELAY_MS} ms late." \
        --sel-delay-ms "$BENCH_SEL_DELAY_MS"
fi
