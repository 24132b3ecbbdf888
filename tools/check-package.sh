#!/usr/bin/env bash
# Builds the Debian package from a configured and built tree (default
# build/) and checks it: the files it installs with their modes, the
# configuration file it installs (a conffile, in band by default), the
# purge script, the symbols the two libraries export, the installed
# selprov serving the built-in sample SEL through the installed provider
# library only where a configuration asks for it, and lintian (errors
# fail, warnings are shown).
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

expected="./etc/qx/platform.conf
./usr/bin/selprov
./usr/lib/cmpi/libSELProvider.so
./usr/lib/cmpi/libqxplatform.so
./usr/sbin/selprovider-register
./usr/share/doc/selprovider/changelog.gz
./usr/share/doc/selprovider/configuration.md
./usr/share/doc/selprovider/copyright
./usr/share/doc/selprovider/deploying.md
./usr/share/man/man1/selprov.1.gz
./usr/share/man/man8/selprovider-register.8.gz
./usr/share/selprovider/SELProvider.mof
./usr/share/selprovider/SELProvider.reg
./usr/share/selprovider/SELProviderRegistration.mof"
actual=$(cd "$root" && find . ! -type d | sort)
if [[ $actual != "$expected" ]]; then
    echo "unexpected package contents:"
    diff <(echo "$expected") <(echo "$actual") || true
    exit 1
fi

# Nothing of the build machine: no file names the source or build tree
# (trace lines name sources relative to it, RUNPATH is $ORIGIN).
if leaks=$(grep -rlF "$PWD" "$root"); then
    echo "package files that name $PWD:"; echo "$leaks"; exit 1
fi

# Modes and owners as the package records them: the configuration may hold
# a password, the state directory is the platform's alone.
listing=$(dpkg-deb -c "$deb")
entry_of() { awk -v p="$1" '$6 == p { print $1, $2 }' <<<"$listing"; }
[[ $(entry_of ./etc/qx/platform.conf) == "-rw------- root/root" ]] ||
    { echo "platform.conf: $(entry_of ./etc/qx/platform.conf)"; exit 1; }
[[ $(entry_of ./var/lib/qx-platform/) == "drwx------ root/root" ]] ||
    { echo "state directory: $(entry_of ./var/lib/qx-platform/)"; exit 1; }

# The configuration is a conffile and reads the server's own BMC in band;
# the other keys are documented, commented out.
control=$(mktemp -d)
trap 'rm -rf "$root" "$control"' EXIT
dpkg-deb -e "$deb" "$control"
[[ $(cat "$control/conffiles") == "/etc/qx/platform.conf" ]] ||
    { echo "conffiles: $(cat "$control/conffiles")"; exit 1; }
settings=$(grep -v '^[[:space:]]*\(#\|$\)' "$root/etc/qx/platform.conf")
[[ $settings == $'source = ipmi\nipmi.interface = inband' ]] ||
    { echo "platform.conf sets: $settings"; exit 1; }
for key in ipmi.host ipmi.user ipmi.password-file ipmi.timeout \
    ipmi.poll-interval ipmi.state-directory memory.fixture log.sink \
    log.level trace.level locale; do
    grep -q "^# $key =" "$root/etc/qx/platform.conf" ||
        { echo "platform.conf does not document $key"; exit 1; }
done
# Purging removes the state directory (dpkg removes the conffile).
grep -q '^ *rm -rf /var/lib/qx-platform$' "$control/postrm" ||
    { echo "postrm does not remove the state directory"; exit 1; }
sh -n "$control/postrm"

# Each library exports its interface and nothing else.
exports() {
    nm -D --defined-only "$1" | awk '{ print $3 }' | sort
}
provider_exports=$(exports "$root/usr/lib/cmpi/libSELProvider.so")
[[ $provider_exports == $'SELProvider_Create_IndicationMI\nSELProvider_Create_InstanceMI\nSELProvider_Create_MethodMI' ]] ||
    { echo "libSELProvider.so exports:"; echo "$provider_exports"; exit 1; }
tools/check-platform-exports.sh "$root/usr/lib/cmpi/libqxplatform.so"

# Without a source configured, the installed selprov reads the in-band BMC:
# on a machine without one, no sample data and one line saying what is
# missing.
if [[ ! -e /dev/ipmi0 ]]; then
    printf 'log.sink = none\n' >"$root/defaults.conf"
    status=0
    out=$("$root/usr/bin/selprov" --config "$root/defaults.conf" \
        enumerate ZAN_MgmtHwLogEntry 2>"$root/errors") || status=$?
    errors=$(cat "$root/errors")
    [[ $status == 0 && -z $out && $errors == *"no in-band BMC"* &&
        $(wc -l <"$root/errors") == 1 ]] ||
        { echo "without a source: status $status, output $out, errors $errors"; exit 1; }
    echo "without a source: $errors"
fi

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
