#!/usr/bin/env bash
# Checks what a built libqxplatform.so exports: every dynamic symbol it
# defines must be one of the patterns of platform/exports.map (nothing of
# the library's internals, no template instantiated in it), and every name
# of platform/exports.txt (what the provider, selprov and the hosts call)
# must be among them. Prints the exported names.
#
#   tools/check-platform-exports.sh [path/to/libqxplatform.so]
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
library=${1:-$here/build/lib/libqxplatform.so}
map=$here/platform/exports.map
required=$here/platform/exports.txt

# The patterns inside extern "C++" { ... } of the version script.
mapfile -t patterns < <(
    sed -n '/extern "C++"/,/};/p' "$map" |
        sed -e 's#/\*.*\*/##' -e 's/^[[:space:]]*//' -e 's/;[[:space:]]*$//' \
            -e 's/^"\(.*\)"$/\1/' |
        grep -v -e '^extern' -e '^}' -e '^$')
[[ ${#patterns[@]} -gt 10 ]] || { echo "no patterns read from $map"; exit 1; }

# Names as c++filt prints them, without the parameter list.
mapfile -t exported < <(
    nm -D --defined-only "$library" | awk '{ print $3 }' | c++filt |
        sed 's/(.*//' | LC_ALL=C sort -u)
[[ ${#exported[@]} -gt 0 ]] || { echo "$library exports nothing"; exit 1; }

status=0
for name in "${exported[@]}"; do
    matched=no
    for pattern in "${patterns[@]}"; do
        # The pattern is a glob, as the linker reads it.
        # shellcheck disable=SC2053
        if [[ $name == $pattern ]]; then
            matched=yes
            break
        fi
    done
    if [[ $matched == no ]]; then
        echo "exported but not part of the interface: $name"
        status=1
    fi
done

while IFS= read -r name; do
    [[ -z $name || $name == \#* ]] && continue
    found=no
    for have in "${exported[@]}"; do
        if [[ $have == "$name" ]]; then
            found=yes
            break
        fi
    done
    if [[ $found == no ]]; then
        echo "not exported: $name"
        status=1
    fi
done <"$required"

if [[ $status != 0 ]]; then
    echo "$library: exports differ from platform/exports.map and exports.txt"
    exit 1
fi
echo "$library exports ${#exported[@]} names:"
printf '  %s\n' "${exported[@]}"
