#!/usr/bin/env bash
# Installs the Debian 12 packages the build and the tests need, skipping
# apt-get entirely when they are already there.
set -euo pipefail

# FreeIPMI is the platform's IPMI library; OpenIPMI's BMC simulator
# (ipmi_sim) and ipmitool serve the tests, the main job and the benchmark;
# libopenipmi-dev has the headers of the simulator module tools/bmcsim builds.
packages=(cmake ninja-build g++ pkg-config googletest libgtest-dev
          libgmock-dev libbenchmark-dev clang-format
          dpkg-dev file lintian
          libfreeipmi-dev freeipmi-tools openipmi ipmitool libopenipmi-dev
          clang-14 libclang-rt-14-dev clang-tidy-14)

missing=()
for package in "${packages[@]}"; do
    if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null |
            grep -q "install ok installed"; then
        missing+=("$package")
    fi
done

if ((${#missing[@]} > 0)); then
    echo "Installing: ${missing[*]}"
    sudo_cmd=()
    if [[ $(id -u) -ne 0 ]]; then
        sudo_cmd=(sudo)
    fi
    "${sudo_cmd[@]}" apt-get update -qq
    DEBIAN_FRONTEND=noninteractive "${sudo_cmd[@]}" apt-get install -y -qq \
        --no-install-recommends "${missing[@]}"
fi
