#!/bin/sh
# Runs the per-entry benchmarks (ScalingBenchmarks.cpp) and prints, for each
# request, the time and heap bytes per entry at every log size and the
# scaling ratio: time per entry at the largest log divided by that at the
# smallest (1.00 = linear).
#
#   bench/scaling.sh [path/to/selprov_bench] [extra benchmark options]
#
# On a busy machine, add --benchmark_repetitions=3
# --benchmark_report_aggregates_only=true: the medians are printed.
#
# Build the benchmarks optimised first: cmake --preset release &&
# cmake --build --preset release --target selprov_bench
set -eu
root=$(cd "$(dirname "$0")/.." && pwd)
bench=${1:-$root/build-release/bin/selprov_bench}
[ $# -gt 0 ] && shift
if [ ! -x "$bench" ]; then
    echo "scaling.sh: no benchmark binary at $bench" >&2
    exit 2
fi
"$bench" --benchmark_filter='BM_Scaling' --benchmark_format=csv "$@" \
    2>/dev/null | awk -F, '
    NR == 1 {
        for (i = 1; i <= NF; i++) { gsub(/"/, "", $i); column[$i] = i }
        next
    }
    {
        gsub(/"/, "", $1)
        # With --benchmark_repetitions, the median of each stands for it.
        if ($1 ~ /_(mean|stddev|cv)$/) next
        split($1, part, "/")
        request = part[1]; sub(/^BM_Scaling/, "", request)
        size = part[2] + 0
        if (!(request in smallest) || size < smallest[request]) smallest[request] = size
        if (!(request in largest) || size > largest[request]) largest[request] = size
        if (!(request in seen)) { seen[request] = 1; order[++requests] = request }
        perEntry[request, size] = $(column["per_entry"]) * 1e6
        bytes[request, size] = $(column["bytes_per_entry"])
        peak[request, size] = $(column["peak_bytes_per_entry"])
        printf "%-24s %6d entries  %8.2f us/entry  %8.0f B/entry allocated  %8.0f B/entry peak\n", \
            request, size, perEntry[request, size], bytes[request, size], peak[request, size]
    }
    END {
        print ""
        for (r = 1; r <= requests; r++) {
            request = order[r]
            printf "%-24s scaling ratio %d -> %d entries: %.2f\n", request, \
                smallest[request], largest[request], \
                perEntry[request, largest[request]] / perEntry[request, smallest[request]]
        }
    }'
