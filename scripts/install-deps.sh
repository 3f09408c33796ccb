#!/usr/bin/env bash
# Installs the Debian 12 packages that building and testing TarnCommandBinder need, plus any
# package named on the command line. Does nothing (and never calls apt) when all are present.
# Needs root, or sudo, when something is missing.
set -euo pipefail

packages=(build-essential cmake ninja-build g++ clang libgtest-dev libgmock-dev googletest
          libbenchmark-dev nlohmann-json3-dev libmsgpack-cxx-dev "$@")

missing=()
for package in "${packages[@]}"; do
    if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q "install ok installed"; then
        missing+=("$package")
    fi
done
if [ ${#missing[@]} -eq 0 ]; then
    exit 0
fi

sudo=()
if [ "$(id -u)" -ne 0 ]; then
    sudo=(sudo)
fi
echo "Installing ${missing[*]} ..."
# Recommends stay on: clang's sanitizer and libFuzzer runtimes come with them.
export DEBIAN_FRONTEND=noninteractive
"${sudo[@]}" apt-get update -qq
"${sudo[@]}" apt-get install -y -qq "${missing[@]}" >/dev/null
