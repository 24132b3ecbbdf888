#!/usr/bin/env bash
# Builds the Debian package from a configured and built tree (default
# build/) and checks it: the files it installs, the installed selprov
# serving the built-in sample SEL through the installed provider library,
# and lintian (errors fail, warnings are shown).
set -euo pipefail
cd "$(dirname "$0")/.."
build=${1:-build}

rm -rf "$build/package"
(cd "$build" && cpack -G DEB >/dev/null)
debs=("$build"/package/selprovider_*.deb)
deb=${debs[0]}
echo "package: $deb"

root=$(mktemp -d)
trap 'rm -rf "$root"' EXIT
dpkg -x "$deb" "$root"

expected="./usr/bin/selprov
./usr/lib/cmpi/libSELProvider.so
./usr/lib/cmpi/libqxplatform.so
./usr/sbin/selprovider-register
./usr/share/doc/selprovider/changelog.gz
./usr/share/doc/selprovider/copyright
./usr/share/doc/selprovider/deploying.md
./usr/share/man/man1/selprov.1.gz
./usr/share/man/man8/selprovider-register.8.gz
./usr/share/selprovider/SELProvider.mof
./usr/share/selprovider/SELProvider.reg
./usr/share/selprovider/SELProviderRegistration.mof
./usr/share/selprovider/platform.conf.example"
actual=$(cd "$root" && find . ! -type d | sort)
if [[ $actual != "$expected" ]]; then
    echo "unexpected package contents:"
    diff <(echo "$expected") <(echo "$actual") || true
    exit 1
fi
mode=$(stat -c %a "$root/usr/share/selprovider/platform.conf.example")
[[ $mode == 600 ]] || { echo "platform.conf.example has mode $mode"; exit 1; }

# The installed selprov finds the installed library by itself, and the
# library finds libqxplatform.so beside it.
printf 'source = memory\nlog.sink = none\n' >"$root/sample.conf"
names=$("$root/usr/bin/selprov" --config "$root/sample.conf" \
    enumerate-names ZAN_MgmtHwLogEntry)
[[ $(grep -c ZAN_MgmtHwLogEntry <<<"$names") -gt 0 ]] ||
    { echo "installed selprov returned no entries"; exit 1; }
"$root/usr/bin/selprov" --config "$root/sample.conf" \
    enumerate ZAN_MgmtHwLog --properties CurrentNumberOfRecords
dynamic=$(readelf -d "$root/usr/lib/cmpi/libSELProvider.so")
grep -qF "runpath: [\$ORIGIN]" <<<"$dynamic" ||
    { echo "libSELProvider.so lacks RUNPATH \$ORIGIN"; exit 1; }

# The installed selprovider-register finds the installed provider files
# (and then refuses: there is no object manager here).
status=0
out=$(PATH=/usr/bin:/bin "$root/usr/sbin/selprovider-register" --dry-run 2>&1) ||
    status=$?
[[ $status == 3 && $out == *"no CIM object manager found"* ]] ||
    { echo "installed selprovider-register: $out"; exit 1; }

lintian --fail-on error "$deb"
echo "package checked"
