#!/usr/bin/env bash
# Installs what a fresh Debian 12 build machine lacks for the build trees: the
# 32-bit toolchain (g++-multilib), the user-mode emulator (qemu-user) that runs
# the static 32-bit test programs, the cross compiler of the 32-bit Windows DLL
# (g++-mingw-w64-i686), the x86 emulator and PE reader of the DLL's emulated
# run (python3-unicorn, python3-pefile), for rnsap-decode (native only)
# libpcap, CLI11 and {fmt}; and for the Python package pybind11, wheel,
# pytest and Dask's distributed scheduler, for Debian's own interpreter.
# Quiet and quick when all is present.
set -euo pipefail

readonly REQUIRED_PACKAGES=(g++ g++-multilib clang clang-format cmake googletest libgtest-dev
  libbenchmark-dev qemu-user python3 binutils g++-mingw-w64-i686 libpcap-dev libcli11-dev
  libfmt-dev python3-dev python3-pybind11 python3-wheel python3-pytest python3-dask
  python3-distributed python3-unicorn python3-pefile)

missing_packages() {
  local package
  for package in "${REQUIRED_PACKAGES[@]}"; do
    if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q "install ok installed"; then
      echo "$package"
    fi
  done
}

main() {
  local -a missing
  mapfile -t missing < <(missing_packages)
  if ((${#missing[@]} == 0)); then
    return 0
  fi
  if ((EUID != 0)); then
    echo "setup.sh: missing packages (${missing[*]}); run as root to install them" >&2
    return 1
  fi
  echo "setup.sh: installing ${missing[*]}"
  export DEBIAN_FRONTEND=noninteractive
  apt-get update -qq
  apt-get install -y -qq --no-install-recommends "${missing[@]}" </dev/null >/dev/null
}

main "$@"
