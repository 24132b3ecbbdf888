#!/usr/bin/env bash
# Builds the libFuzzer targets of fuzz/ with clang-14 under ASan+UBSan in
# build-fuzz/ and runs each for a bounded time on a copy of its seed corpus
# (the committed corpus is never changed). Prints the executions per target
# and fails if any target finds a crash, a leak or a sanitizer report.
#
#   tools/run-fuzzers.sh              # every target, 30 s each
#   FUZZ_SECONDS=5 tools/run-fuzzers.sh
#   tools/run-fuzzers.sh object_path fixture
#
# A failing input is kept under build-fuzz/findings/<target>/.
set -euo pipefail
cd "$(dirname "$0")/.."

seconds=${FUZZ_SECONDS:-30}
build=build-fuzz

tools/setup-deps.sh

echo "== fuzz build"
CC=clang-14 CXX=clang++-14 cmake -S . -B "$build" -G Ninja \
    -DCMAKE_BUILD_TYPE=RelWithDebInfo -DSELPROV_SANITIZER=address \
    -DSELPROV_FUZZ=ON -DBUILD_TESTING=OFF -DSELPROV_BENCHMARKS=OFF >/dev/null
cmake --build "$build" --target fuzzers

if (($# > 0)); then
    targets=("$@")
else
    targets=()
    for dir in fuzz/corpus/*/; do
        targets+=("$(basename "$dir")")
    done
fi

export ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1:abort_on_error=1}
export UBSAN_OPTIONS=${UBSAN_OPTIONS:-print_stacktrace=1:halt_on_error=1}

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
summary=()
failed=0
for target in "${targets[@]}"; do
    echo "== fuzz $target (${seconds} s)"
    corpus="$work/$target"
    findings="$build/findings/$target"
    mkdir -p "$corpus" "$findings"
    cp fuzz/corpus/"$target"/* "$corpus"/
    log="$work/$target.log"
    status=0
    "$build/bin/fuzz_$target" -max_total_time="$seconds" -timeout=10 \
        -rss_limit_mb=2048 -print_final_stats=1 \
        -artifact_prefix="$findings/" "$corpus" >"$log" 2>&1 || status=$?
    runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log" | tail -1)
    if ((status != 0)); then
        tail -n 60 "$log"
        summary+=("$(printf '%-16s FAILED (exit %d), inputs in %s' \
            "$target" "$status" "$findings")")
        failed=1
    else
        summary+=("$(printf '%-16s %12s executions' "$target" "${runs:-?}")")
    fi
done

echo "== fuzz summary (${seconds} s per target)"
printf '%s\n' "${summary[@]}"
exit "$failed"
