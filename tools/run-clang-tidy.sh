#!/usr/bin/env bash
# Runs clang-tidy-14 with the checks of .clang-tidy over every source file
# of our own in the compile_commands.json of a build (default: build/, the
# default preset, which must have been configured) and fails on any
# finding.
#
#   tools/run-clang-tidy.sh [BUILD_DIR]
#   TIDY_JOBS=4 tools/run-clang-tidy.sh
set -euo pipefail
cd "$(dirname "$0")/.."

build=${1:-build}
jobs=${TIDY_JOBS:-2}

if [[ ! -f $build/compile_commands.json ]]; then
    echo "run-clang-tidy: no $build/compile_commands.json; configure first" \
        "(cmake --preset default)" >&2
    exit 2
fi

# Sources generated into the build tree are not ours to lint; the source
# tree's are, tests and tools included.
source_dir=$(pwd)
start=$(date +%s)
status=0
run-clang-tidy-14 -quiet -j "$jobs" -p "$build" \
    "^${source_dir}/(bench|diagnostics|factory|fuzz|host|indication|model|platform|provider|tests|tools)/" \
    >"$build/clang-tidy.raw.log" 2>&1 || status=$?
# run-clang-tidy-14 always asks for colours; the log is kept without them.
sed 's/\x1b\[[0-9;]*m//g' "$build/clang-tidy.raw.log" >"$build/clang-tidy.log"
rm -f "$build/clang-tidy.raw.log"
# Findings read file:line:col: warning|error: text [check].
grep -E ': (warning|error): ' "$build/clang-tidy.log" | sort -u || true
echo "clang-tidy: $(( $(date +%s) - start )) s, log in $build/clang-tidy.log"
if ((status != 0)); then
    echo "clang-tidy: findings or errors (exit $status)" >&2
    exit 1
fi
