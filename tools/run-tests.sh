#!/usr/bin/env bash
# Builds and runs every test: the plain build (warnings as errors, format
# check, clang-tidy), then the ASan+UBSan build and the TSan build, then
# each fuzz target for a bounded time (FUZZ_SECONDS, default 30).
set -euo pipefail
cd "$(dirname "$0")/.."

tools/setup-deps.sh

echo "== format check"
if git rev-parse --is-inside-work-tree >/dev/null 2>&1; then
    git ls-files -z -- '*.h' '*.cpp'
else
    find . -path './build*' -prune -o \( -name '*.h' -o -name '*.cpp' \) \
        -print0
fi | xargs -0 clang-format --dry-run --Werror

for preset in default asan tsan; do
    echo "== $preset build"
    cmake --preset "$preset" -DSELPROV_WERROR=ON >/dev/null
    cmake --build --preset "$preset"
    echo "== $preset tests"
    ctest --preset "$preset" -j 2
    if [[ $preset == default ]]; then
        echo "== clang-tidy"
        tools/run-clang-tidy.sh build
        echo "== package"
        tools/check-package.sh build
    fi
done

echo "== fuzzers"
tools/run-fuzzers.sh
