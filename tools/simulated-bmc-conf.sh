# Sourced by the scripts that run the provider on the BMC simulator.
#
# simulated_bmc_conf FILE HOST DIR [LINE...]
# Writes to FILE the platform configuration of the IPMI source on the
# simulator at HOST over IPMI 2.0 LAN, as its admin user, with the password
# in DIR/bmc.password and the source's state in DIR/platform-state; each
# LINE is appended as it stands. Sets the umask to 077 first, so that the
# password file is readable by its owner only.
simulated_bmc_conf() {
    local file=$1 host=$2 dir=$3
    shift 3
    umask 077
    printf 'password\n' >"$dir/bmc.password"
    {
        cat <<EOF
source = ipmi
ipmi.interface = lan
ipmi.host = $host
ipmi.user = admin
ipmi.password-file = $dir/bmc.password
ipmi.privilege = admin
ipmi.workarounds = opensesspriv
ipmi.state-directory = $dir/platform-state
EOF
        printf '%s\n' "$@"
    } >"$file"
}
