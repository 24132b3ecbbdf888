#!/usr/bin/env bash
# Builds and runs every test: the plain build (warnings as errors, format
# check), then the ASan+UBSan build and the TSan build.
set -euo pipefail
cd "$(dirname "$0")/.."

tools/setup-deps.sh

echo "== format check"
git ls-files -- '*.h' '*.cpp' |
    xargs clang-format --dry-run --Werror

for preset in default asan tsan; do
    echo "== $preset build"
    cmake --preset "$preset" -DSELPROV_WERROR=ON >/dev/null
    cmake --build --preset "$preset"
    echo "== $preset tests"
    ctest --preset "$preset" -j 2
done
